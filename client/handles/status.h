// Status: what a call below the entry points answers: a return code and, for all but success, the published error
// number and the engine's own words where it had some. The gate (gate.h) turns it into a record and the return code.
#pragma once

#include <memory>
#include <string>
#include <utility>

#include "handles/errors.h"

class [[nodiscard]] Status {
public:
    Status() = default;    // success
    Status(int code, int number) : code_(code), number_(number) {}
    Status(int code, int number, std::string detail) : code_(code), number_(number), detail_(Keep(std::move(detail))) {}

    [[nodiscard]] bool Ok() const { return code_ == 0; }           // OCI_SUCCESS
    [[nodiscard]] bool Failed() const { return code_ < 0; }
    [[nodiscard]] int Code() const { return code_; }               // OCI_SUCCESS, OCI_ERROR, OCI_NO_DATA, ...
    [[nodiscard]] int Number() const { return number_; }           // published error number; 0: no record
    [[nodiscard]] std::string Detail() const { return detail_ ? *detail_ : std::string(); }
    [[nodiscard]] const char* Engine() const { return engine_; }   // who says it, in the record's text
    [[nodiscard]] bool Plain() const { return engine_ == kClient && !detail_; }    // its number says all

    static constexpr char kClient[] = "CLIENT";

    // The same status as said by an engine: a literal like "SQLITE".
    Status&& From(const char* engine) && { engine_ = engine; return std::move(*this); }

private:
    static std::shared_ptr<const std::string> Keep(std::string detail) {
        return detail.empty() ? nullptr : std::make_shared<const std::string>(std::move(detail));
    }

    const char* engine_ = kClient;
    int code_ = 0;
    int number_ = 0;
    std::shared_ptr<const std::string> detail_;    // null: none, as in nearly all that are made
};

inline Status Error(int number) { return {-1, number}; }
inline Status Error(int number, std::string detail) { return {-1, number, std::move(detail)}; }
inline Status Warning(int number) { return {1, number}; }
inline Status Warning(int number, std::string detail) { return {1, number, std::move(detail)}; }
inline Status NoData() { return {100, errors::kNoRows}; }
inline Status NeedData(int number) { return {99, number}; }
inline Status InvalidHandle() { return {-2, 0}; }
