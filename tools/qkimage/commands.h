// The commands of qkimage, their usage text (one table, used by the global
// help and by each command's own), and the messages they print. Each command
// takes the arguments after its own name and returns the exit status: 0 done,
// 1 the operation failed, 2 a usage error.
#ifndef QKIMAGE_COMMANDS_H
#define QKIMAGE_COMMANDS_H

#include <stdint.h>
#include <stdio.h>

#include <initializer_list>
#include <string>

#include "args.h"

struct Command {
    const char* name;
    int (*run)(int argc, char** argv);
    const char* args;     // what follows the name
    const char* summary;  // what it does, a line or two
    const char* example;
};

extern const Command kCommands[];
extern const int kCommandCount;
// The command of that name, or null.
const Command* find_command(const char* name);

// The whole help: every command with its example, the format names.
void print_help(FILE* stream);
// One command's usage, summary and example.
void print_usage(const Command& command, FILE* stream);

// Reads "--name value" and "--name=value" for the options in `takes_value`,
// the flags --help/-h and --verbose, and everything else as paths. Returns
// -1 to go on, otherwise the exit status: 0 after printing the command's
// help, 2 after a usage error.
int parse_options(const char* command, int argc, char** argv, std::initializer_list<const char*> takes_value,
                  Options* options);

// "qkimage CMD: message" and the command's usage line on stderr; returns 2.
int usage_error(const char* command, const std::string& message);
// "qkimage CMD: message" on stderr; returns 1.
int failure(const char* command, const std::string& message);
// The sentence for an operation the library refused: what failed, and where
// to find the library's own report.
int operation_failed(const char* command, const std::string& what);
// "qkimage CMD: warning: message" on stderr.
void warning(const char* command, const std::string& message);

// Typed options: each prints a usage error and returns false when the option
// is missing (if required) or malformed.
bool size_option(const char* command, const Options& options, const char* name, int32_t* width, int32_t* height);
bool format_option(const char* command, const Options& options, const char* name, uint32_t* format);
// --quality, 1..100, `fallback` when absent.
bool quality_option(const char* command, const Options& options, int32_t fallback, int32_t* quality);
// Exactly `count` paths (input, output).
bool path_count(const char* command, const Options& options, size_t count);

int cmd_formats(int argc, char** argv);
int cmd_options(int argc, char** argv);
int cmd_convert(int argc, char** argv);
int cmd_rotate(int argc, char** argv);
int cmd_scale(int argc, char** argv);
int cmd_crop(int argc, char** argv);
int cmd_encode(int argc, char** argv);
int cmd_decode(int argc, char** argv);
int cmd_save(int argc, char** argv);
int cmd_load(int argc, char** argv);
int cmd_demo(int argc, char** argv);

#endif  // QKIMAGE_COMMANDS_H
