// Argument parsing shared by the qkimage subcommands.
#ifndef QKIMAGE_ARGS_H
#define QKIMAGE_ARGS_H

#include <stdint.h>

#include <string>

struct FormatName {
    const char* name;
    uint32_t code;
};

// Every format code the library knows, in a stable order.
extern const FormatName kFormats[];
extern const int kFormatCount;

// "NV21" -> its code (letter case ignored); false for unknown names.
bool parse_format(const char* text, uint32_t* code);
// The printable name of a code ("D16", "PCL", "????" for unknown codes).
std::string format_name(uint32_t code);
// "WIDTHxHEIGHT" with both at least 1.
bool parse_size(const char* text, int32_t* width, int32_t* height);

#endif  // QKIMAGE_ARGS_H
