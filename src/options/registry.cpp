#include "options/registry.h"

#include <string.h>

#include <atomic>
#include <new>

#include "util/log.h"

namespace qk::options {
namespace {

// Keys drawn so far; new keys continue above this value.
std::atomic<uint32_t> key_counter{0x13370000u};

Register& mutable_register() {
    // One-time initialisation that is safe when first uses race. Destroyed at
    // exit, which frees only the register's own storage, never the records.
    static Register instance;
    return instance;
}

bool has_name(const QKOption_t& option, const char* name) {
    return option.name != nullptr && strcmp(option.name, name) == 0;
}

// The first record, in register order, that `matches`; null when none does.
template <typename Predicate>
const QKOption_t* find_first(Predicate matches) {
    const Register& options = option_register();
    for (size_t i = 0; i < options.size(); ++i) {
        const QKOption_t* option = options.itemAt(i).value;
        if (option != nullptr && matches(*option)) return option;
    }
    return nullptr;
}

void dump_enum(int index, const QKOption_t& option, unsigned key) {
    const QKOptionEnum_t* entry = option.enumValues;
    if (entry == nullptr || entry->value == QK_OPTION_ENUM_END) {
        QK_LOG(QK_LOG_ERROR, "OptionsRegister[%02d]: '%s' 0x%08x ENUM <NO VALUES>", index, option.name, key);
        return;
    }
    for (; entry->value != QK_OPTION_ENUM_END; ++entry) {
        QK_LOG(QK_LOG_DEBUG, "OptionsRegister[%02d]: '%s' 0x%08x ENUM [%d] %s", index, option.name, key,
               entry->value, entry->name != nullptr ? entry->name : "(null)");
    }
}

// One line per registered record (one per value for enumerations), in
// register order.
void dump(const Register& options) {
    for (size_t i = 0; i < options.size(); ++i) {
        const int index = static_cast<int>(i);
        const QKOption_t* option = options.itemAt(i).value;
        if (option == nullptr) {
            QK_LOG(QK_LOG_DEBUG, "OptionsRegister[%02d]: NULL", index);
            continue;
        }
        const char* name = option->name;
        const unsigned key = static_cast<uint32_t>(option->key);
        switch (option->type) {
            case QK_OPTION_INTEGER:
                QK_LOG(QK_LOG_DEBUG, "OptionsRegister[%02d]: '%s' 0x%08x INTEGER %d - %d", index, name, key,
                       option->min.i, option->max.i);
                break;
            case QK_OPTION_FLOAT:
                QK_LOG(QK_LOG_DEBUG, "OptionsRegister[%02d]: '%s' 0x%08x FLOAT %f - %f", index, name, key,
                       static_cast<double>(option->min.f), static_cast<double>(option->max.f));
                break;
            case QK_OPTION_STRING:
                QK_LOG(QK_LOG_DEBUG, "OptionsRegister[%02d]: '%s' 0x%08x STRING", index, name, key);
                break;
            case QK_OPTION_ENUM:
                dump_enum(index, *option, key);
                break;
            default:
                QK_LOG(QK_LOG_ERROR, "OptionsRegister[%02d]: '%s' 0x%08x INVALID TYPE (%d)", index, name, key,
                       static_cast<int>(option->type));
                break;
        }
    }
}

}  // namespace

const Register& option_register() { return mutable_register(); }

int32_t draw_key() {
    // Unsigned, so that the counter wraps instead of overflowing.
    return static_cast<int32_t>(key_counter.fetch_add(1, std::memory_order_acq_rel) + 1);
}

}  // namespace qk::options

using qk::options::find_first;
using qk::options::has_name;

int32_t QKOption_RegisterNew(QKOption_t* option) {
    if (option == nullptr) return 0;
    if (option->name == nullptr) {
        QK_LOG(QK_LOG_ERROR, "ERROR: Trying to register an option without a name! [key = 0x%08x]",
               static_cast<uint32_t>(option->key));
        return 0;
    }
    qk::options::Register& options = qk::options::mutable_register();

    if (option->key == 0) {
        const QKOption_t* same = find_first([option](const QKOption_t& registered) {
            return registered.type == option->type && has_name(registered, option->name);
        });
        if (same != nullptr) {
            // The earlier record stays the registered one; this one shares its key.
            option->key = same->key;
            QK_LOG(QK_LOG_DEBUG, "DEBUG: Duplicate option found: '%s' with type %d. Key = %d", option->name,
                   static_cast<int>(option->type), option->key);
            return 1;
        }
        option->key = qk::options::draw_key();
        QK_LOG(QK_LOG_DEBUG, "DEBUG: Registering option '%s' as key 0x%08x", option->name,
               static_cast<uint32_t>(option->key));
    }

    if (options.indexOf(option->key) >= 0) {
        QK_LOG(QK_LOG_ERROR, "ERROR: Trying to register new option with an already existing key! [key = 0x%08x]",
               static_cast<uint32_t>(option->key));
        return 0;
    }
    try {
        options.add(option->key, option);
    } catch (const std::bad_alloc&) {
        QK_LOG(QK_LOG_ERROR, "ERROR: Out of memory registering option '%s' [key = 0x%08x]", option->name,
               static_cast<uint32_t>(option->key));
        return 0;
    }
    qk::options::dump(options);
    return 1;
}

const QKOption_t* QKOption_FindByName(const char* name) {
    if (name == nullptr) return nullptr;
    return find_first([name](const QKOption_t& option) { return has_name(option, name); });
}

int32_t QKOption_FindIdByName(const char* name) {
    const QKOption_t* option = QKOption_FindByName(name);
    return option != nullptr ? option->key : 0;
}

const QKOption_t* QKOption_FindById(int32_t key) {
    // A walk over the records' own keys, not a search of the sorted order.
    return find_first([key](const QKOption_t& option) { return option.key == key; });
}

const char* QKOption_FindNameById(int32_t key) {
    const QKOption_t* option = QKOption_FindById(key);
    return option != nullptr ? option->name : nullptr;
}
