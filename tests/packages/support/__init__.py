"""What the package tests are written with: packages, and hosts to install them on."""
