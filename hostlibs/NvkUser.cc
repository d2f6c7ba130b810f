// The kernel user-space library. The program names it when it is linked, because the host's
// kernel-control library is built on it, and calls none of its operations.
