// Optional modules loaded at run time with the dynamic loader. A Module owns
// one reference to a loaded library and drops it when it goes out of scope.
#ifndef QKCORE_SRC_PLATFORM_MODULE_H
#define QKCORE_SRC_PLATFORM_MODULE_H

namespace qk::platform {

class Module {
public:
    Module() = default;
    // Opens the library by file name with immediate binding; an empty Module
    // when it cannot be loaded.
    static Module open(const char* file_name);

    Module(Module&& other) noexcept : handle_(other.handle_) { other.handle_ = nullptr; }
    Module& operator=(Module&& other) noexcept;
    Module(const Module&) = delete;
    Module& operator=(const Module&) = delete;
    ~Module() { close(); }

    explicit operator bool() const { return handle_ != nullptr; }

    // The address of an exported name, or null when absent (or no module).
    void* symbol(const char* name) const;
    template <typename Fn>
    Fn function(const char* name) const {
        return reinterpret_cast<Fn>(symbol(name));
    }

    void close();

private:
    explicit Module(void* handle) : handle_(handle) {}
    void* handle_ = nullptr;
};

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_MODULE_H
