/* A system log that throws everything away, so that a measured program logs at the price of a host
 * whose log daemon keeps up. As a batch job it does not interrupt the program at each message where
 * both share a processor (sched(7)). Usage: syslog-sink SOCKET
 */
#define _GNU_SOURCE
#include <sched.h>
#include <stdio.h>
#include <string.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

int main(int argc, char** argv) {
    struct sockaddr_un address = {.sun_family = AF_UNIX};
    if (argc != 2 || strlen(argv[1]) >= sizeof address.sun_path) {
        fputs("usage: syslog-sink SOCKET\n", stderr);
        return 2;
    }
    strcpy(address.sun_path, argv[1]);
    const struct sched_param priority = {.sched_priority = 0};
    if (sched_setscheduler(0, SCHED_BATCH, &priority) != 0) {
        perror("syslog-sink");
        return 1;
    }
    const int bound = socket(AF_UNIX, SOCK_DGRAM, 0);
    if (bound < 0 || bind(bound, (struct sockaddr*)&address, sizeof address) != 0) {
        perror("syslog-sink");
        return 1;
    }
    puts("ready");
    fflush(stdout);
    char message[8192];
    while (recv(bound, message, sizeof message, 0) >= 0) {
    }
    return 1;
}
