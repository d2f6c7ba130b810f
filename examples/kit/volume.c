/* Makes the folder that the kit's other plugins note themselves in. Waits for nobody. */
#include <vantor/plugin.h>

#include <errno.h>
#include <stdio.h>
#include <sys/stat.h>

VANTOR_METHOD(make_volume) {
    if (mkdir("/var/run/kit", 0755) != 0 && errno != EEXIST) {
        return 1;
    }
    FILE* file = fopen("/var/run/kit/boot", "w");
    if (file == NULL) {
        return 2;
    }
    const int written = fputs("volume\n", file) >= 0;
    return fclose(file) == 0 && written ? 0 : 3;
}

static const char* const gives[] = {"kit-volume", NULL};

VANTOR_OPERATIONS(make_volume);
VANTOR_METADATA_1(NULL, gives);
