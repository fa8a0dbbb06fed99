#include "platform/module.h"

#include <dlfcn.h>

namespace qk::platform {

Module Module::open(const char* file_name) { return Module(dlopen(file_name, RTLD_NOW)); }

Module& Module::operator=(Module&& other) noexcept {
    if (this != &other) {
        close();
        handle_ = other.handle_;
        other.handle_ = nullptr;
    }
    return *this;
}

void* Module::symbol(const char* name) const { return handle_ != nullptr ? dlsym(handle_, name) : nullptr; }

void Module::close() {
    if (handle_ != nullptr) dlclose(handle_);
    handle_ = nullptr;
}

}  // namespace qk::platform
