// Argument parsing shared by the qkimage commands: format names, numbers,
// sizes, and the "--name value" / "--name=value" options of every command.
#ifndef QKIMAGE_ARGS_H
#define QKIMAGE_ARGS_H

#include <stdint.h>

#include <map>
#include <string>
#include <vector>

// What the tool adds to the library's format table: common names of the
// same layouts, accepted too, and a line for the help.
struct FormatNote {
    uint32_t code;
    const char* aliases;  // comma-separated, "" for none
    const char* about;
};
// The note on a format; no aliases and no line for a format without one.
const FormatNote& format_note(uint32_t code);

// "NV21", "nv21", "I420", "yuv420p"... -> its code (letter case ignored);
// false for unknown names.
bool parse_format(const char* text, uint32_t* code);
// The printable name of a code ("D16", "PCL", "????" for unknown codes).
std::string format_name(uint32_t code);

// The one number reader: a decimal integer in [min, max] at the start of
// `text` (a sign only where min is negative); *end is left just past it.
bool parse_number(const char* text, const char** end, int64_t min, int64_t max, int32_t* value);
// A whole signed 32-bit number and nothing else.
bool parse_int(const char* text, int32_t* value);
// "WIDTHxHEIGHT" with both at least 1.
bool parse_size(const char* text, int32_t* width, int32_t* height);
// "X,Y" with any signed 32-bit values.
bool parse_point(const char* text, int32_t* x, int32_t* y);

// Set by --verbose (global, or given to any command): the library's own
// messages go to standard error.
extern bool g_verbose;

// A command's arguments after parse_options: options by name ("--size"),
// and the other arguments in order ("-" included).
struct Options {
    std::map<std::string, std::string> values;
    std::vector<std::string> paths;

    bool has(const char* name) const { return values.count(name) != 0; }
    const char* get(const char* name) const { return has(name) ? values.at(name).c_str() : nullptr; }
};

#endif  // QKIMAGE_ARGS_H
