/* Stands in for every program that the library starts, told apart by the name it is called by: the
 * real ones take a second each. Only the Spotlight switch has a memory. */

#include <fcntl.h>
#include <string.h>
#include <unistd.h>

static const char kSwitch[] = "/run/torture.spotlight";

static int Is(const char *path, const char *name) {
    const char *slash = strrchr(path, '/');
    return strcmp(slash != NULL ? slash + 1 : path, name) == 0;
}

static int ShowSwitch(void) {
    char text[4] = "no\n";
    const int fd = open(kSwitch, O_RDONLY);
    ssize_t size = fd >= 0 ? read(fd, text, sizeof(text)) : 3;
    size = size > 0 ? size : 0;
    return write(STDOUT_FILENO, text, (size_t)size) == size ? 0 : 1;
}

static int TurnSwitch(const char *text) {
    const int fd = open(kSwitch, O_WRONLY | O_CREAT | O_TRUNC, 0644);
    const ssize_t size = (ssize_t)strlen(text);
    return write(fd, text, (size_t)size) == size ? 0 : 1;
}

int main(int argc, char **argv) {
    if (Is(argv[0], "testparm")) {
        return ShowSwitch();
    }
    if (Is(argv[0], "net")) {
        return argc > 1 ? TurnSwitch(argv[argc - 1]) : 1;
    }
    return 0;
}
