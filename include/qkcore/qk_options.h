// Options: a process-wide registry of named, typed options, value checks and
// readers for "name=value,..." option strings.
#ifndef QKCORE_QK_OPTIONS_H
#define QKCORE_QK_OPTIONS_H

#include <stdint.h>

#include "qk_common.h"

// The type of an option (QKOption_t::type). Any other value is invalid.
QK_TYPED_ENUM(QKOptionType, uint32_t) {
    QK_OPTION_INTEGER = 0,
    QK_OPTION_FLOAT = 1,
    QK_OPTION_STRING = 2,
    QK_OPTION_ENUM = 3,
};

// The value of the entry that ends an enumeration list.
#ifdef __cplusplus
constexpr int32_t QK_OPTION_ENUM_END = -1;
#else
#define QK_OPTION_ENUM_END ((int32_t)-1)
#endif

// One entry of an enumeration. A list ends with an entry whose value is
// QK_OPTION_ENUM_END; that entry's name is not read.
typedef struct QKOptionEnum_t {
    int32_t value;
    const char* name;
} QKOptionEnum_t;

// One 32-bit bound: `i` for INTEGER options, `f` for FLOAT options. In C++
// the constructors let records be written as aggregates: {0, "ev",
// QK_OPTION_FLOAT, -2.0f, 2.0f, nullptr} or {0, "iso", QK_OPTION_INTEGER,
// 100, 3200, nullptr}; C names the member of a float bound: {.f = -2.0f}.
typedef union QKOptionBound_t {
#ifdef __cplusplus
    constexpr QKOptionBound_t() : i(0) {}
    constexpr QKOptionBound_t(int32_t value) : i(value) {}
    constexpr QKOptionBound_t(float value) : f(value) {}
#endif

    int32_t i;
    float f;
} QKOptionBound_t;

// An option record. It belongs to the component that fills it in and must
// stay alive, with its key, name and type unchanged, for as long as it is
// registered (the rest of the process): the register keeps only its address.
// Registration writes the key and nothing else.
typedef struct QKOption_t {
    int32_t key;                       // 0: assigned at registration; else fixed by the caller
    const char* name;                  // compared byte for byte
    uint32_t type;                     // a QKOptionType
    QKOptionBound_t min;               // INTEGER and FLOAT: both 0 means "no range"
    QKOptionBound_t max;
    const QKOptionEnum_t* enumValues;  // ENUM: the values, ended by QK_OPTION_ENUM_END
} QKOption_t;

QK_BEGIN_C_DECLS

// Registers the record and returns 1, or returns 0 when it is refused (null
// record or name, or a key already in the register). A record without a key
// takes the key of an earlier record of the same name and type (and is then
// not added itself), or a new one. Logs the whole register after each
// addition. Registrations and lookups are not locked: callers serialise them.
QK_API int32_t QKOption_RegisterNew(QKOption_t* option);
// The first registered record (in ascending key order) with this name, or null.
QK_API const QKOption_t* QKOption_FindByName(const char* name);
// That record's key, or 0.
QK_API int32_t QKOption_FindIdByName(const char* name);
// The first registered record whose key is `key`, or null.
QK_API const QKOption_t* QKOption_FindById(int32_t key);
// That record's name, or null.
QK_API const char* QKOption_FindNameById(int32_t key);

// Value checks: 1 when the value suits the option, 0 otherwise (always 0 for
// a null record or a record of another type). An INTEGER or FLOAT option
// whose min and max are both 0 takes every value; otherwise min <= value <=
// max. A STRING option takes every string; an ENUM option takes the names
// of its entries (letter case counts).
QK_API int32_t QKOption_CheckValueI(const QKOption_t* option, int32_t value);
QK_API int32_t QKOption_CheckValueF(const QKOption_t* option, float value);
QK_API int32_t QKOption_CheckValueS(const QKOption_t* option, const char* value);

// Readers of "name=value,name=value" strings (no spaces around the
// separators). They return the value of the first item with this name, or
// the default when there is none, when its value cannot be read (an integer
// out of the 32-bit range counts as unreadable), or when the string or name
// is null, empty or the name contains '=' or ','. The string is only read.
QK_API int32_t QKOption_ParseStringI(const char* options, const char* name, int32_t defaultValue);
QK_API float QKOption_ParseStringF(const char* options, const char* name, float defaultValue);

QK_END_C_DECLS

#endif  // QKCORE_QK_OPTIONS_H
