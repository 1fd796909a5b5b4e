// What SQL functions are made of: their table's row, arguments read, results and errors given back. Shared by the files
// that hold the functions. A function may throw bad_alloc; the list catches it. Views of arguments live as long as the
// call.
#pragma once

#include <sqlite3.h>

#include <array>
#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

#include "date/date.h"
#include "engine/engine.h"
#include "number/number.h"
#include "oci.h"

namespace engine::sqlite {

using Arguments = sqlite3_value**;

constexpr int kAnyCount = -1;

struct FunctionRow {
    const char* name;
    int least;    // arguments
    int most;     // kAnyCount: no limit, and the function itself sees to `least`
    int flags;
    void (*call)(sqlite3_context*, int, Arguments);
    std::string_view type = {};    // of the result, as a declaration; empty: told by the values
    int like = 0;                  // the argument, from 1, whose type the result has
};

// The tables of the further files.
std::span<const FunctionRow> ConversionFunctions();
std::span<const FunctionRow> DateFunctions();
std::span<const FunctionRow> TextFunctions();

// A result that is an error: Failure reads number and detail back.
void Refuse(sqlite3_context* context, const Status& status);
void Refuse(sqlite3_context* context, int number);

// Views of SQLite's own memory. They throw bad_alloc where SQLite has none.
std::string_view Bytes(sqlite3_value* value);
std::string_view TextOf(sqlite3_value* value);

bool AnyNull(int count, Arguments arguments);
bool IsNumber(sqlite3_value* value);
// A date in the engine's text form.
bool IsDate(sqlite3_value* value, date::DateTime& result);

// Any value as a number, as a whole number without its fraction, or as a date: 0 or an error number.
int ReadNumber(sqlite3_value* value, OCINumber& number);
int ReadWhole(sqlite3_value* value, std::int64_t& whole);
int ReadDate(sqlite3_value* value, date::DateTime& result);

// Decimal numbers are read into `number`, which must live as long as the datum.
Datum ReadDatum(sqlite3_value* value, OCINumber& number);

void ReturnNumber(sqlite3_context* context, const OCINumber& number);
void ReturnDatum(sqlite3_context* context, const Datum& datum);
void ReturnDate(sqlite3_context* context, const date::DateTime& value);

// A value as text, numbers as they are shown; `usual` where it is null, as of an argument that is missing.
class TextArgument {
public:
    explicit TextArgument(sqlite3_value* value, std::string_view usual = {});
    TextArgument(const TextArgument&) = delete;
    TextArgument& operator=(const TextArgument&) = delete;
    [[nodiscard]] int Failure() const { return failure_; }    // 0 or an error number
    [[nodiscard]] std::string_view Text() const { return text_; }

private:
    std::array<char, number::kMaxPlainText> digits_;
    std::string_view text_;
    int failure_ = 0;
};

// The text or bytes of a result, in the memory that SQLite takes over. An empty one is a null.
class ResultText {
public:
    explicit ResultText(std::size_t capacity);
    explicit operator bool() const { return bytes_ != nullptr; }    // false: no memory
    void Append(std::string_view text) { size_ += text.copy(bytes_.get() + size_, text.size()); }
    void Append(char c) { bytes_.get()[size_++] = c; }
    void Return(sqlite3_context* context);
    void ReturnBytes(sqlite3_context* context);

private:
    struct Free {
        void operator()(char* bytes) const { sqlite3_free(bytes); }
    };
    std::unique_ptr<char, Free> bytes_;
    std::size_t size_ = 0;
};

}  // namespace engine::sqlite
