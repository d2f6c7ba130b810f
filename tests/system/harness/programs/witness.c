/* Stands in for a daemon or a shell and notes how it was started, a line a fact, in
 * /tmp/seen.<name it was started by>: its arguments, its environment, its open descriptors,
 * its session, whether it leads it and whether standard input is the terminal of that session.
 * One more line, "ran <name>", goes to /tmp/ran.
 */
#define _GNU_SOURCE

#include <fcntl.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <termios.h>
#include <unistd.h>

enum { highestDescriptor = 70000 };

extern char** environ;

static void NoteRun(const char* name) {
    char line[256];
    const int length = snprintf(line, sizeof line, "ran %s\n", name);
    const int ran = open("/tmp/ran", O_WRONLY | O_CREAT | O_APPEND, 0644);
    if (ran < 0 || write(ran, line, (size_t)length) != length) {
        abort();
    }
    close(ran);
}

int main(int argc, char** argv) {
    static char open_[highestDescriptor];
    for (int fd = 0; fd < highestDescriptor; ++fd) {
        open_[fd] = fcntl(fd, F_GETFD) != -1;
    }
    const char* slash = strrchr(argv[0], '/');
    const char* name = slash != NULL ? slash + 1 : argv[0];
    char path[256];
    snprintf(path, sizeof path, "/tmp/seen.%s", name);
    FILE* seen = fopen(path, "w");
    if (seen == NULL) {
        return 1;
    }
    for (int i = 0; i < argc; ++i) {
        fprintf(seen, "argument %s\n", argv[i]);
    }
    for (char** variable = environ; *variable != NULL; ++variable) {
        fprintf(seen, "variable %s\n", *variable);
    }
    for (int fd = 0; fd < highestDescriptor; ++fd) {
        if (open_[fd]) {
            fprintf(seen, "descriptor %d\n", fd);
        }
    }
    fprintf(seen, "session %d\n", (int)getsid(0));
    fprintf(seen, "leads its session: %s\n", getsid(0) == getpid() ? "yes" : "no");
    fprintf(seen, "terminal of its session: %s\n", tcgetsid(0) == getsid(0) ? "yes" : "no");
    fclose(seen);
    NoteRun(name);
    return 0;
}
