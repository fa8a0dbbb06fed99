// Fuzz target: the option-string readers against sscanf, the value checks
// against their documented rules, and the process-wide register against a
// model of it kept here.
//
// Input: commands until the input ends (at most 16), each one byte mod 4:
//   0 read:     flags (bit 0: null string, bit 1: null name), the string
//               (text(64)), the name (text(16)), an int default (u32) and a
//               float default (u32 bits);
//   1 register: a record (see take_record) registered from a static pool;
//   2 find:     a name (text(12)), flags (bit 1: null name), a key (u32)
//               and a byte: for flags & 1 the key is model record `byte`'s;
//   3 check:    a record (not registered), flags (bit 0: null record, bit 1:
//               null string), an int (u32), a float (u32 bits) and a string
//               (text(8); for flags & 4 the name of enumeration entry `byte`).
#include <stdint.h>
#include <stdio.h>
#include <string.h>

#include <algorithm>
#include <cctype>
#include <string>
#include <vector>

#include "fuzz/fuzz_support.h"
#include "qkcore/qk_options.h"

namespace {

using qkfuzz::check;
using qkfuzz::Input;

// ---- Readers ----

// The text of the value of the first item "name=value" of the string (up to
// the item's closing comma), or false when there is none or the string or
// name cannot be read.
bool reference_item(const char* options, const char* name, std::string* value) {
    if (options == nullptr || name == nullptr || name[0] == '\0' || strpbrk(name, "=,") != nullptr) return false;
    const std::string all(options), prefix = std::string(name) + "=";
    for (size_t start = 0;;) {
        const size_t end = all.find(',', start);
        const std::string item = all.substr(start, end == std::string::npos ? std::string::npos : end - start);
        if (item.compare(0, prefix.size(), prefix) == 0) {
            *value = item.substr(prefix.size());
            return true;
        }
        if (end == std::string::npos) return false;
        start = end + 1;
    }
}

// What "%d" takes, read exactly; false when sscanf fails or the value lies
// outside int32 (documented: unreadable rather than wrapped).
bool reference_int(const std::string& text, int32_t* value) {
    int consumed = -1;
    sscanf(text.c_str(), "%*d%n", &consumed);
    if (consumed < 0) return false;
    size_t i = 0;
    while (isspace(static_cast<unsigned char>(text[i]))) ++i;
    const bool negative = text[i] == '-';
    if (text[i] == '-' || text[i] == '+') ++i;
    int64_t magnitude = 0;
    for (; i < static_cast<size_t>(consumed); ++i) {
        magnitude = std::min<int64_t>(magnitude * 10 + (text[i] - '0'), int64_t{1} << 40);
    }
    const int64_t read = negative ? -magnitude : magnitude;
    if (read < INT32_MIN || read > INT32_MAX) return false;
    *value = static_cast<int32_t>(read);
    return true;
}

bool same_float(float a, float b) { return (a != a && b != b) || memcmp(&a, &b, sizeof(a)) == 0; }

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

    std::string text;
    const bool found = reference_item(o, n, &text);
    int32_t expectI = defaultI;
    if (found && !reference_int(text, &expectI)) expectI = defaultI;
    float expectF = defaultF;
    if (!found || sscanf(text.c_str(), "%f", &expectF) != 1) expectF = defaultF;

    check(QKOption_ParseStringI(o, n, defaultI) == expectI, "ParseStringI differs from sscanf %d");
    check(same_float(QKOption_ParseStringF(o, n, defaultF), expectF), "ParseStringF differs from sscanf %f");
    check(o == nullptr || options == o, "a reader wrote to its string");
}

// ---- Records ----

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

// The register as the documentation describes it: records in ascending key
// order, keys drawn from 0x13370001 up.
std::vector<const QKOption_t*> g_model;
uint32_t g_lastKey = 0x13370000u;

bool same_name(const QKOption_t* record, const char* name) {
    return record->name != nullptr && name != nullptr && strcmp(record->name, name) == 0;
}

// Fills the slot from the input: key (byte mod 4: 0 and 1 no key, 2 the key
// of model record `byte`, 3 a raw u32), name (byte mod 8 == 7: null, else
// text(12)), type (byte mod 5: the four types, 4: a raw u32), min and max
// (u32 bits each) and, for ENUM, 0..4 entries (byte mod 5, each a value byte
// minus 1 and a text(8) name) or null (count byte 255).
void take_record(Input& in, Slot& slot) {
    slot = Slot{};
    QKOption_t& r = slot.record;
    switch (in.byte() % 4) {
        case 2: {
            const uint8_t pick = in.byte();
            if (!g_model.empty()) r.key = g_model[pick % g_model.size()]->key;
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

const QKOption_t* model_first(bool (*matches)(const QKOption_t*, const void*), const void* what) {
    for (const QKOption_t* record : g_model) {
        if (matches(record, what)) return record;
    }
    return nullptr;
}

void register_record(Input& in) {
    Slot* slot = std::find_if(g_pool, g_pool + kPool, [](const Slot& s) { return !s.registered; });
    if (slot == g_pool + kPool) return;  // full: the register keeps what it has
    take_record(in, *slot);
    QKOption_t& r = slot->record;
    const QKOption_t before = r;

    int32_t expectResult = 0, expectKey = r.key;
    bool added = false;
    if (r.name != nullptr) {
        const QKOption_t* same = nullptr;
        if (r.key == 0) {
            same = model_first(
                [](const QKOption_t* m, const void* o) {
                    const QKOption_t* option = static_cast<const QKOption_t*>(o);
                    return m->type == option->type && same_name(m, option->name);
                },
                &r);
            expectKey = same != nullptr ? same->key : static_cast<int32_t>(++g_lastKey);
        }
        if (same != nullptr) {
            expectResult = 1;
        } else {
            const bool taken = std::any_of(g_model.begin(), g_model.end(),
                                           [&](const QKOption_t* m) { return m->key == expectKey; });
            expectResult = taken ? 0 : 1;
            added = !taken;
        }
    }
    const int32_t result = QKOption_RegisterNew(&r);
    check(result == expectResult, "RegisterNew: unexpected result");
    check(r.key == expectKey, "RegisterNew: unexpected key");
    check(r.name == before.name && r.type == before.type && r.min.i == before.min.i && r.max.i == before.max.i &&
              r.enumValues == before.enumValues,
          "RegisterNew wrote more than the key");
    if (!added) return;
    slot->registered = true;
    g_model.insert(std::upper_bound(g_model.begin(), g_model.end(), r.key,
                                    [](int32_t key, const QKOption_t* m) { return key < m->key; }),
                   &r);
}

void find(Input& in) {
    const std::string name = in.text(12);
    const uint8_t flags = in.byte();
    int32_t key = static_cast<int32_t>(in.u32());
    const uint8_t pick = in.byte();
    if ((flags & 1) != 0 && !g_model.empty()) key = g_model[pick % g_model.size()]->key;
    const char* n = (flags & 2) != 0 ? nullptr : name.c_str();

    const QKOption_t* byName =
        n == nullptr ? nullptr
                     : model_first([](const QKOption_t* m, const void* s) { return same_name(m, static_cast<const char*>(s)); },
                                   n);
    const QKOption_t* byKey =
        model_first([](const QKOption_t* m, const void* k) { return m->key == *static_cast<const int32_t*>(k); },
                    &key);
    check(QKOption_FindByName(n) == byName, "FindByName differs from the model");
    check(QKOption_FindIdByName(n) == (byName != nullptr ? byName->key : 0), "FindIdByName differs from the model");
    check(QKOption_FindById(key) == byKey, "FindById differs from the model");
    check(QKOption_FindNameById(key) == (byKey != nullptr ? byKey->name : nullptr),
          "FindNameById differs from the model");
}

// ---- Value checks ----

void check_values(Input& in) {
    Slot slot;
    take_record(in, slot);
    const QKOption_t& r = slot.record;
    const uint8_t flags = in.byte();
    const int32_t valueI = static_cast<int32_t>(in.u32());
    const float valueF = as_float(in.u32());
    std::string valueS = in.text(8);
    if ((flags & 4) != 0 && r.enumValues != nullptr) {
        const uint8_t pick = in.byte();
        int count = 0;
        while (r.enumValues[count].value != QK_OPTION_ENUM_END) ++count;
        if (count > 0) valueS = r.enumValues[pick % count].name;
    }
    const QKOption_t* option = (flags & 1) != 0 ? nullptr : &r;
    const char* s = (flags & 2) != 0 ? nullptr : valueS.c_str();

    int32_t expectI = 0, expectF = 0, expectS = 0;
    if (option != nullptr && r.type == QK_OPTION_INTEGER) {
        expectI = (r.min.i == 0 && r.max.i == 0) || (r.min.i <= valueI && valueI <= r.max.i);
    }
    if (option != nullptr && r.type == QK_OPTION_FLOAT) {
        expectF = (r.min.f == 0.0f && r.max.f == 0.0f) || (r.min.f <= valueF && valueF <= r.max.f);
    }
    if (option != nullptr && r.type == QK_OPTION_STRING) expectS = 1;
    if (option != nullptr && r.type == QK_OPTION_ENUM && r.enumValues != nullptr && s != nullptr) {
        for (const QKOptionEnum_t* e = r.enumValues; e->value != QK_OPTION_ENUM_END; ++e) {
            if (e->name != nullptr && strcmp(e->name, s) == 0) expectS = 1;
        }
    }
    check(QKOption_CheckValueI(option, valueI) == expectI, "CheckValueI differs from its rule");
    check(QKOption_CheckValueF(option, valueF) == expectF, "CheckValueF differs from its rule");
    check(QKOption_CheckValueS(option, s) == expectS, "CheckValueS differs from its rule");
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
