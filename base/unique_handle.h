#pragma once

#include <utility>

// Owns one handle of the system or of a library and closes it when it goes.
// The traits name the kind:
//
//   struct Traits {
//       using Value = ...;              // the handle as the API has it
//       static Value Invalid();         // the value that holds nothing
//       static void Close(Value value); // called once for each other value
//   };
//
// Move-only, as a handle has one owner.
template <typename Traits>
class UniqueHandle {
public:
    using Value = typename Traits::Value;

    UniqueHandle() = default;
    explicit UniqueHandle(Value owned) : value(owned) {}
    UniqueHandle(UniqueHandle&& other) noexcept : value(other.Release()) {}
    UniqueHandle& operator=(UniqueHandle&& other) noexcept {
        Reset(other.Release());
        return *this;
    }
    UniqueHandle(const UniqueHandle&) = delete;
    UniqueHandle& operator=(const UniqueHandle&) = delete;
    ~UniqueHandle() { Reset(); }

    Value Get() const { return value; }
    bool IsValid() const { return value != Traits::Invalid(); }
    explicit operator bool() const { return IsValid(); }

    // Gives the handle up without closing it.
    Value Release() { return std::exchange(value, Traits::Invalid()); }
    // Closes the handle held, if any, and holds replacement instead.
    void Reset(Value replacement = Traits::Invalid()) {
        const Value old = std::exchange(value, replacement);
        if (old != Traits::Invalid()) Traits::Close(old);
    }
    // For a call that hands a new handle back through a pointer: closes the
    // handle held, then lends the place to write the new one to.
    Value* Receive() {
        Reset();
        return &value;
    }

private:
    Value value = Traits::Invalid();
};
