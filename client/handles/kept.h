// A pointer that is kept to an object which others may free: it gives the object, or null once that is gone, even where
// another one of its kind lies at the same address now. The class has a member `birth` for this.
//
// Threads: set and read at any time, from any thread; who reads while it is set may get null. Read inside a call in
// flight, as Live is.
#pragma once

#include <atomic>
#include <cstdint>

#include "handles/object.h"

// Tells an object from all others of the process, before and after it.
struct Birth {
    const std::uint64_t number = ++last;

private:
    inline static constinit std::atomic<std::uint64_t> last{0};
};

template <class T>
class Kept {
public:
    void Set(const T* object) noexcept {
        pointer_ = nullptr;    // never the new object with the former one's number
        birth_ = object ? object->birth.number : 0;
        pointer_ = object;
    }
    [[nodiscard]] T* Get() const noexcept {
        T* object = Live<T>(pointer_.load());
        return object && object->birth.number == birth_ ? object : nullptr;
    }

private:
    std::atomic<const T*> pointer_{nullptr};
    std::atomic<std::uint64_t> birth_{0};
};
