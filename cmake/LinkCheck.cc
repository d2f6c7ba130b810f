// A shared library needs one source of its own; everything that its link proves is in the archive.
