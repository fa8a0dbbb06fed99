// Fuzz target: the option-string readers against sscanf, and the register
// and value checks driven with records, names and values from the input,
// held to what each answer implies (a record found by name has that name,
// one found by key that key, a record registered is found by its key).
//
// Input: commands until the input ends (at most 16), each one byte mod 4:
//   0 read:     flags (bit 0: null string, bit 1: null name), the string
//               (text(64)), the name (text(16)), an int default (u32) and a
//               float default (u32 bits);
//   1 register: a record (see take_record) registered from a static pool;
//   2 find:     a name (text(12)), flags (bit 1: null name), a key (u32)
//               and a byte: for flags & 1 the key is registered record
//               `byte`'s (in ascending key order);
//   3 check:    a record (not registered), flags (bit 0: null record, bit 1:
//               null string), an int (u32), a float (u32 bits) and a string
//               (text(8); for flags & 4 the name of enumeration entry `byte`).
#include <stdint.h>
#include <stdio.h>
#include <string.h>

#include <algorithm>
#include <iterator>
#include <map>
#include <string>

#include "fuzz/fuzz_support.h"
#include "qkcore/qk_options.h"

namespace {

using namespace qkfuzz;

// Where the value of the first item "name=..." of the string starts, or null:
// the first ",name=" of the string with a comma put in front.
const char* item_value(const char* options, const char* name) {
    if (options == nullptr || name == nullptr || name[0] == '\0' || strpbrk(name, "=,") != nullptr) return nullptr;
    const std::string prefix = "," + std::string(name) + "=";
    const size_t at = ("," + std::string(options)).find(prefix);
    return at == std::string::npos ? nullptr : options + at + prefix.size() - 1;
}

float as_float(uint32_t bits) {
    float value;
    memcpy(&value, &bits, sizeof(value));
    return value;
}

void read_values(Input& in) {
    const uint8_t flags = in.byte();
    const std::string options = in.text(64), name = in.text(16);
    const int32_t defaultI = static_cast<int32_t>(in.u32());
    const float defaultF = as_float(in.u32());
    const char* o = (flags & 1) != 0 ? nullptr : options.c_str();
    const char* n = (flags & 2) != 0 ? nullptr : name.c_str();

    // "%d" and "%f" as sscanf reads them; an integer past 32 bits is unreadable.
    const char* text = item_value(o, n);
    long long i = 0;
    float f = defaultF, got = QKOption_ParseStringF(o, n, defaultF);
    if (text == nullptr || sscanf(text, "%lld", &i) != 1 || i < INT32_MIN || i > INT32_MAX) i = defaultI;
    if (text == nullptr || sscanf(text, "%f", &f) != 1) f = defaultF;
    check(QKOption_ParseStringI(o, n, defaultI) == i, "ParseStringI differs from sscanf %d");
    check(memcmp(&got, &f, sizeof(f)) == 0, "ParseStringF differs from sscanf %f");
    check(o == nullptr || options == o, "a reader wrote to its string");
}

// A record with storage for its name and enumeration that lives as long as
// the process: the register keeps only the record's address.
struct Slot {
    QKOption_t record;
    char name[16];
    QKOptionEnum_t values[5];
    char valueNames[4][12];
    bool registered;
};
constexpr size_t kPool = 64;
Slot g_pool[kPool];
std::map<int32_t, const QKOption_t*> g_registered;  // by key, in ascending order

const QKOption_t* registered(uint8_t pick) {
    return std::next(g_registered.begin(), pick % g_registered.size())->second;
}

// Fills the slot from the input: key (byte mod 4: 0 and 1 no key, 2 the key
// of registered record `byte`, 3 a raw u32), name (byte mod 8 == 7: null,
// else text(12)), type (byte mod 5: the four types, 4: a raw u32), min and
// max (u32 bits each) and, for ENUM, 0..4 entries (byte mod 5, each a value
// byte minus 1 and a text(8) name) or null (count byte 255).
void take_record(Input& in, Slot& slot) {
    slot = Slot{};
    QKOption_t& r = slot.record;
    switch (in.byte() % 4) {
        case 2: {
            const uint8_t pick = in.byte();
            if (!g_registered.empty()) r.key = registered(pick)->key;
            break;
        }
        case 3: r.key = static_cast<int32_t>(in.u32()); break;
        default: break;
    }
    if (in.byte() % 8 != 7) {
        const std::string name = in.text(12);
        memcpy(slot.name, name.c_str(), name.size() + 1);
        r.name = slot.name;
    }
    const uint8_t type = in.byte() % 5;
    r.type = type < 4 ? type : in.u32();
    r.min.i = static_cast<int32_t>(in.u32());
    r.max.i = static_cast<int32_t>(in.u32());
    if (r.type != QK_OPTION_ENUM) return;
    const uint8_t count = in.byte();
    if (count == 255) return;
    size_t i = 0;
    for (; i < count % 5u; ++i) {
        slot.values[i].value = in.byte() - 1;
        const std::string name = in.text(8);
        memcpy(slot.valueNames[i], name.c_str(), name.size() + 1);
        slot.values[i].name = slot.valueNames[i];
    }
    slot.values[i] = {QK_OPTION_ENUM_END, nullptr};
    r.enumValues = slot.values;
}

bool same_name(const QKOption_t* record, const char* name) {
    return record->name != nullptr && name != nullptr && strcmp(record->name, name) == 0;
}

// Registration writes no more than a new key, and a record it takes is found
// by that key (the record itself, or an earlier one of its name and type).
void register_record(Input& in) {
    Slot* slot = std::find_if(g_pool, g_pool + kPool, [](const Slot& s) { return !s.registered; });
    if (slot == g_pool + kPool) return;  // full: the register keeps what it has
    take_record(in, *slot);
    QKOption_t& r = slot->record;
    const QKOption_t before = r;
    const int32_t result = QKOption_RegisterNew(&r);
    const QKOption_t* found = QKOption_FindById(r.key);
    check(r.name == before.name && r.type == before.type && r.enumValues == before.enumValues &&
              (before.key == 0 || r.key == before.key) &&
              (result == 0 ? r.name == nullptr || found != nullptr
                           : result == 1 && found != nullptr && found->type == r.type && same_name(found, r.name)),
          "RegisterNew wrote more than a new key, refused a free one, or took a record its key does not find");
    if (result == 1 && found == &r) slot->registered = true, g_registered[r.key] = &r;
}

// What is found by name has that name, by key that key; a registered record
// is found by its key, and by its name unless an earlier key has the name.
void find(Input& in) {
    const std::string name = in.text(12);
    const uint8_t flags = in.byte();
    int32_t key = static_cast<int32_t>(in.u32());
    const uint8_t pick = in.byte();
    const QKOption_t* picked = (flags & 1) != 0 && !g_registered.empty() ? registered(pick) : nullptr;
    if (picked != nullptr) key = picked->key;
    const char* n = (flags & 2) != 0 ? nullptr : name.c_str();
    const QKOption_t *byName = QKOption_FindByName(n), *byKey = QKOption_FindById(key);
    check((byName == nullptr ? QKOption_FindIdByName(n) == 0
                             : same_name(byName, n) && QKOption_FindIdByName(n) == byName->key) &&
              (byKey == nullptr ? QKOption_FindNameById(key) == nullptr
                                : byKey->key == key && QKOption_FindNameById(key) == byKey->name) &&
              (picked == nullptr || (byKey == picked && QKOption_FindIdByName(picked->name) <= key)),
          "Find*: a record of another name or key, or a registered record not found");
}

// Each check answers 0 or 1, 0 for a record of another type; a name of the
// enumeration passes.
void check_values(Input& in) {
    Slot slot;
    take_record(in, slot);
    const QKOption_t& r = slot.record;
    const uint8_t flags = in.byte();
    const int32_t valueI = static_cast<int32_t>(in.u32());
    const float valueF = as_float(in.u32());
    std::string valueS = in.text(8);
    bool entry = false;
    if ((flags & 4) != 0 && r.enumValues != nullptr) {
        const uint8_t pick = in.byte();
        int count = 0;
        while (r.enumValues[count].value != QK_OPTION_ENUM_END) ++count;
        if ((entry = count > 0)) valueS = r.enumValues[pick % count].name;
    }
    const QKOption_t* option = (flags & 1) != 0 ? nullptr : &r;
    const char* s = (flags & 2) != 0 ? nullptr : valueS.c_str();
    const uint32_t type = option != nullptr ? r.type : UINT32_MAX;
    const int32_t i = QKOption_CheckValueI(option, valueI), f = QKOption_CheckValueF(option, valueF);
    const int32_t text = QKOption_CheckValueS(option, s);
    check(i == (type == QK_OPTION_INTEGER && i == 1) && f == (type == QK_OPTION_FLOAT && f == 1) &&
              text == (type == QK_OPTION_STRING || (type == QK_OPTION_ENUM && (text == 1 || (entry && s != nullptr)))),
          "CheckValue: an answer other than 0 or 1, 1 for another type, or a name of the enumeration refused");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = (qkfuzz::quiet_log(), true);
    (void)ready;
    Input in(data, size);
    for (int command = 0; command < 16 && !in.empty(); ++command) {
        switch (in.byte() % 4) {
            case 0: read_values(in); break;
            case 1: register_record(in); break;
            case 2: find(in); break;
            default: check_values(in); break;
        }
    }
    return 0;
}
