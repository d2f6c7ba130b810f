"""The parts of scripts/bench: workloads, measurements in pairs, and the report."""
