/* Runs a program with a folder as its "/": enter [options] ROOT PROGRAM ARGUMENT...
 *
 *   -c FOLDER   working directory inside the root (default "/")
 *   -f BYTES    files may grow to so many bytes: writing past them fails, without a signal
 *   -n COUNT    open-file limit, as near to COUNT as this process may raise it
 *   -s BYTES    stack size limit, also that of every thread
 *   -l NUMBER   a descriptor of that number is left open for the program (repeatable)
 *   -g          lead a process group of its own, so that no new session can be made
 *   -a          without address space randomisation
 *   -p          stop when the program has been executed, for the parent to let it go (ptrace)
 *
 * 125 is the status of every failure before the program runs.
 */
#define _GNU_SOURCE
#define _FILE_OFFSET_BITS 64 /* limits have 64 bits on every machine */

#include <errno.h>
#include <fcntl.h>
#include <signal.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/personality.h>
#include <sys/ptrace.h>
#include <sys/resource.h>
#include <unistd.h>

static void Fail(const char* what) {
    fprintf(stderr, "enter: %s: %s\n", what, strerror(errno));
    exit(125);
}

static void LimitFileSize(const char* bytes) {
    const rlim_t size = strtoull(bytes, NULL, 10);
    const struct rlimit limit = {size, size};
    signal(SIGXFSZ, SIG_IGN);
    if (setrlimit(RLIMIT_FSIZE, &limit) != 0) {
        Fail("file size");
    }
}

/* Halves the wish until the kernel grants it; the hard limit is granted to everyone. */
static void LimitOpenFiles(const char* count) {
    struct rlimit now;
    if (getrlimit(RLIMIT_NOFILE, &now) != 0) {
        Fail("open files");
    }
    for (rlim_t wish = strtoull(count, NULL, 10); wish > now.rlim_max; wish /= 2) {
        const struct rlimit limit = {wish, wish};
        if (setrlimit(RLIMIT_NOFILE, &limit) == 0) {
            return;
        }
    }
    const rlim_t wish = strtoull(count, NULL, 10);
    now.rlim_cur = wish < now.rlim_max ? wish : now.rlim_max;
    if (setrlimit(RLIMIT_NOFILE, &now) != 0) {
        Fail("open files");
    }
}

static void LimitStackSize(const char* bytes) {
    struct rlimit limit;
    if (getrlimit(RLIMIT_STACK, &limit) != 0) {
        Fail("stack size");
    }
    limit.rlim_cur = strtoull(bytes, NULL, 10);
    if (setrlimit(RLIMIT_STACK, &limit) != 0) {
        Fail("stack size");
    }
}

static void LeakDescriptor(const char* number) {
    const int fd = open("/", O_RDONLY);
    if (fd < 0 || dup2(fd, atoi(number)) < 0) {
        Fail("descriptor");
    }
    if (fd != atoi(number)) {
        close(fd);
    }
}

int main(int argc, char** argv) {
    const char* folder = "/";
    int option, traced = 0;
    while ((option = getopt(argc, argv, "+c:f:n:s:l:gap")) != -1) {
        switch (option) {
        case 'c':
            folder = optarg;
            break;
        case 'f':
            LimitFileSize(optarg);
            break;
        case 'n':
            LimitOpenFiles(optarg);
            break;
        case 's':
            LimitStackSize(optarg);
            break;
        case 'l':
            LeakDescriptor(optarg);
            break;
        case 'g':
            setpgid(0, 0);
            break;
        case 'a':
            /* Where a container forbids it the program runs as it is. */
            (void)personality(ADDR_NO_RANDOMIZE);
            break;
        case 'p':
            traced = 1;
            break;
        default:
            return 125;
        }
    }
    if (argc - optind < 2) {
        errno = EINVAL;
        Fail("arguments");
    }
    if (chroot(argv[optind]) != 0 || chdir(folder) != 0) {
        Fail(argv[optind]);
    }
    if (traced && ptrace(PTRACE_TRACEME, 0, NULL, NULL) != 0) {
        Fail("ptrace");
    }
    execv(argv[optind + 1], argv + optind + 1);
    Fail(argv[optind + 1]);
}
