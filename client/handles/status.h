// Status: what a call below the entry points answers: a return code and, for all but success, the published error
// number and the engine's own words where it had some. The gate (gate.h) turns it into a record and the return code.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>
#include <utility>

#include "handles/errors.h"

// Two words, of which most that are made are zero: they pass through every layer of every call.
class [[nodiscard]] Status {
public:
    static constexpr char kClient[] = "CLIENT";

    Status() = default;    // success
    Status(int code, int number) noexcept : code_(code), number_(number) {}
    Status(int code, int number, std::string detail) : Status(code, number) {
        if (!detail.empty()) said_ = reinterpret_cast<Packed>(new Words{kClient, std::move(detail)}) | kHasWords;
    }
    Status(const Status& other) noexcept : code_(other.code_), number_(other.number_), said_(other.said_) {
        if (HasWords()) TheWords()->holders.fetch_add(1, std::memory_order_relaxed);
    }
    Status(Status&& other) noexcept
        : code_(other.code_), number_(other.number_), said_(std::exchange(other.said_, 0)) {}
    Status& operator=(const Status& other) noexcept { return *this = Status(other); }
    Status& operator=(Status&& other) noexcept {
        code_ = other.code_;
        number_ = other.number_;
        std::swap(said_, other.said_);
        return *this;
    }
    ~Status() { if (HasWords()) LeaveWords(); }

    [[nodiscard]] bool Ok() const { return code_ == 0; }           // OCI_SUCCESS
    [[nodiscard]] bool Failed() const { return code_ < 0; }
    [[nodiscard]] int Code() const { return code_; }               // OCI_SUCCESS, OCI_ERROR, OCI_NO_DATA, ...
    [[nodiscard]] int Number() const { return number_; }           // published error number; 0: no record
    [[nodiscard]] std::string Detail() const { return HasWords() ? TheWords()->detail : std::string(); }
    // Who says it, in the record's text.
    [[nodiscard]] const char* Engine() const {
        if (HasWords()) return TheWords()->engine;
        return said_ == 0 ? kClient : reinterpret_cast<const char*>(said_ >> 1);
    }
    [[nodiscard]] bool Plain() const { return said_ == 0; }    // its number says all

    // The same status, of which there is no copy yet, as said by an engine: a literal like "SQLITE".
    Status&& From(const char* engine) && {
        if (HasWords()) TheWords()->engine = engine;
        else said_ = reinterpret_cast<Packed>(engine) << 1;
        return std::move(*this);
    }

private:
    // What was said and by whom; shared by the copies of a status.
    struct Words {
        const char* engine;
        std::string detail;
        std::atomic<int> holders{1};
    };

    // A pointer beside one bit. That of words is even, and stands as it is, for checkers of leaks to find it; a literal's
    // leaves the topmost bit free, as addresses of programs do.
    using Packed = std::uintptr_t;
    static constexpr Packed kHasWords = 1;
    [[nodiscard]] bool HasWords() const noexcept { return (said_ & kHasWords) != 0; }
    [[nodiscard]] Words* TheWords() const noexcept { return reinterpret_cast<Words*>(said_ & ~kHasWords); }
    void LeaveWords() const noexcept {
        if (TheWords()->holders.fetch_sub(1, std::memory_order_acq_rel) == 1) delete TheWords();
    }

    std::int32_t code_ = 0;
    std::int32_t number_ = 0;
    Packed said_ = 0;    // the engine's name, or Words; 0: the client, without words
};

inline Status Error(int number) { return {-1, number}; }
inline Status Error(int number, std::string detail) { return {-1, number, std::move(detail)}; }
inline Status Warning(int number) { return {1, number}; }
inline Status Warning(int number, std::string detail) { return {1, number, std::move(detail)}; }
inline Status NoData() { return {100, errors::kNoRows}; }
inline Status NeedData(int number) { return {99, number}; }
inline Status InvalidHandle() { return {-2, 0}; }
