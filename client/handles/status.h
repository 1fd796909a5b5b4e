// Status: what a call below the entry points answers: a return code and, for all but success, the published error
// number and the engine's own words where it had some. The gate (gate.h) turns it into a record and the return code.
#pragma once

#include <string>
#include <utility>

class [[nodiscard]] Status {
public:
    Status() = default;    // success
    Status(int code, int number, std::string detail = {}) : code_(code), number_(number), detail_(std::move(detail)) {}

    [[nodiscard]] bool Ok() const { return code_ == 0; }           // OCI_SUCCESS
    [[nodiscard]] bool Failed() const { return code_ < 0; }
    [[nodiscard]] int Code() const { return code_; }               // OCI_SUCCESS, OCI_ERROR, OCI_NO_DATA, ...
    [[nodiscard]] int Number() const { return number_; }           // published error number; 0: no record
    [[nodiscard]] const std::string& Detail() const { return detail_; }
    [[nodiscard]] const char* Engine() const { return engine_; }   // who says it, in the record's text

    // The same status as said by an engine: a literal like "SQLITE".
    Status&& From(const char* engine) && { engine_ = engine; return std::move(*this); }

private:
    const char* engine_ = "CLIENT";
    int code_ = 0;
    int number_ = 0;
    std::string detail_;
};

inline Status Error(int number, std::string detail = {}) { return {-1, number, std::move(detail)}; }
inline Status Warning(int number, std::string detail = {}) { return {1, number, std::move(detail)}; }
inline Status NoData() { return {100, 1403}; }
inline Status NeedData(int number) { return {99, number}; }
inline Status InvalidHandle() { return {-2, 0}; }
