/* Tells for each full path given whether it is indexed. Exit status 0 when all are, 3 otherwise. */

#include <fileindex/fileindex.h>
#include <stdio.h>

enum { EXIT_ALL_INDEXED = 0, EXIT_USAGE = 2, EXIT_NOT_INDEXED = 3 };

int main(int argc, char **argv) {
    if (argc < 2) {
        (void)fprintf(stderr, "Usage: %s FULL_PATH...\n", argv[0]);
        return EXIT_USAGE;
    }
    int status = EXIT_ALL_INDEXED;
    for (int i = 1; i < argc; ++i) {
        const int is_indexed = FILEIDXIsFullPathIndexed(argv[i]);
        (void)printf("%s: %s\n", argv[i], is_indexed ? "indexed" : "not indexed");
        if (!is_indexed) {
            status = EXIT_NOT_INDEXED;
        }
    }
    return status;
}
