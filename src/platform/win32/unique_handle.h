// One move-only owner for every kind of system handle; a typedef per kind.
#pragma once

#include <windows.h>

#include <utility>

namespace vantorel::win32 {

// Traits: `Type`, `static Type Invalid()`, `static void Close(Type)`.
template <typename Traits>
class UniqueHandle {
    using T = typename Traits::Type;
    static T Invalid() { return Traits::Invalid(); }

public:
    UniqueHandle() = default;
    explicit UniqueHandle(T handle) : handle_(handle) {}
    UniqueHandle(const UniqueHandle&) = delete;
    UniqueHandle& operator=(const UniqueHandle&) = delete;
    UniqueHandle(UniqueHandle&& other) noexcept : handle_(std::exchange(other.handle_, Invalid())) {}
    UniqueHandle& operator=(UniqueHandle&& other) noexcept {
        if (this != &other) reset(std::exchange(other.handle_, Invalid()));
        return *this;
    }
    ~UniqueHandle() { reset(); }

    T get() const { return handle_; }
    explicit operator bool() const { return handle_ != Invalid(); }
    T release() { return std::exchange(handle_, Invalid()); }
    void reset() { reset(Invalid()); }
    void reset(T handle) {
        if (handle_ != Invalid()) Traits::Close(handle_);
        handle_ = handle;
    }
    // For out-parameters of creating calls: releases the current handle first.
    T* put() {
        reset();
        return &handle_;
    }

private:
    T handle_ = Invalid();
};

template <typename H, auto CloseFunction>
struct NullInvalid {
    using Type = H;
    static Type Invalid() { return nullptr; }
    static void Close(Type handle) { CloseFunction(handle); }
};

struct FileTraits {
    using Type = HANDLE;
    static Type Invalid() { return INVALID_HANDLE_VALUE; }
    static void Close(Type handle) { ::CloseHandle(handle); }
};

using UniqueHkey = UniqueHandle<NullInvalid<HKEY, ::RegCloseKey>>;
using UniqueFile = UniqueHandle<FileTraits>;
using UniqueKernelHandle = UniqueHandle<NullInvalid<HANDLE, ::CloseHandle>>;

}  // namespace vantorel::win32
