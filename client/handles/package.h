// Packages that must be initialised before they are used: the file and the thread package. Initialisations are counted,
// for the whole process; each is matched by one termination.
#pragma once

#include <atomic>

#include "handles/gate.h"

class Package {
public:
    // The error of a call outside of an initialisation, and its words.
    constexpr Package(int number, const char* words) : number_(number), words_(words) {}

    void Init() { inits_.fetch_add(1); }

    Status Term() {
        int count = inits_.load();
        while (count > 0) {
            if (inits_.compare_exchange_weak(count, count - 1)) return {};
        }
        return Error(number_, words_);
    }

    // Calls of the package, once it is initialised: body(environment).
    template <class Body>
    sword Enter(const void* handle, OCIError* err, Body&& body) noexcept {
        return EnterHandle(handle, err, [&](Environment& environment) -> Status {
            return inits_.load() > 0 ? body(environment) : Error(number_, words_);
        });
    }

private:
    std::atomic<int> inits_{0};
    int number_;
    const char* words_;
};
