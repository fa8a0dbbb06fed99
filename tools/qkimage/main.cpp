// qkimage: raw camera frames and pictures through the qkcore library.
#include <stdarg.h>
#include <stdio.h>
#include <string.h>

#include "args.h"
#include "commands.h"
#include "qkcore/qk_log.h"

namespace {

// The library writes every message to standard output by default, which
// would mix with frames written to "-". Its messages (failure reports
// naming source lines included) are for whoever asks with --verbose; by
// default each command says what failed in its own words.
int log_to_stderr_when_verbose(int level, ...) {
    if (!g_verbose) return 0;
    static const char* const kTags[] = {"V", "D", "I", "W", "E"};
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    fprintf(stderr, "qkimage: library [%s] ", level >= 0 && level <= 4 ? kTags[level] : "V");
    vfprintf(stderr, format, args);
    fputc('\n', stderr);
    va_end(args);
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    HX_LogMsg = log_to_stderr_when_verbose;
    int first = 1;
    for (; first < argc && strcmp(argv[first], "--verbose") == 0; ++first) g_verbose = true;
    if (first == argc) {
        fprintf(stderr, "usage: qkimage [--verbose] COMMAND [ARGS...]   (qkimage --help lists the commands)\n");
        return 2;
    }
    const char* name = argv[first];
    if (strcmp(name, "--help") == 0 || strcmp(name, "-h") == 0 || strcmp(name, "help") == 0) {
        const Command* command = first + 1 < argc ? find_command(argv[first + 1]) : nullptr;
        if (command == nullptr && first + 1 < argc) {
            fprintf(stderr, "qkimage: no command '%s' (qkimage --help lists them)\n", argv[first + 1]);
            return 2;
        }
        if (command != nullptr) {
            print_usage(*command, stdout);
        } else {
            print_help(stdout);
        }
        return 0;
    }
    if (strcmp(name, "--version") == 0) {
        printf("qkimage %s\n", QKIMAGE_VERSION);
        return 0;
    }
    const Command* command = find_command(name);
    if (command == nullptr) {
        fprintf(stderr, "qkimage: unknown command '%s' (qkimage --help lists them)\n", name);
        return 2;
    }
    return command->run(argc - first - 1, argv + first + 1);
}
