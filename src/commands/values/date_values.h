// Dates as the commands write, print and store them. Command thread only.
#pragma once

#include "commands/shared/value_operation.h"
#include "objects/value_display.h"

// Copies the date into the first element of the SQLT_ODT buffer that the word names. "null" stores nothing; any other
// word that names no such buffer is complained about.
void StoreDate(const char* word, const OCIDate& date);

// A line for each flag that a check of a date or datetime has set.
void PrintDateCheckFlags(uword flags);

// "null" passes a null pointer; a word that begins with a digit is a literal, any other names an SQLT_ODT buffer.
template <> class Operand<const OCIDate*> {
public:
    bool Resolve(const char* word, ErrorWord&);
    const OCIDate* Argument() const { return pointer_; }

private:
    OCIDate value_ = {};
    const OCIDate* pointer_ = nullptr;
};
using DateOperand = Operand<const OCIDate*>;

template <> struct ResultForm<OCIDate> {
    static constexpr bool kStored = true;
    static constexpr bool kPrintedAnyway = true;
    static constexpr OCIDate kInitial = {};
    static void Print(const OCIDate& date, OCIError*) { PrintDate(date); }
    static void Store(const char* word, const OCIDate& date) { StoreDate(word, date); }
};

// The only unsigned results are check flags.
template <> struct ResultForm<uword> {
    static constexpr bool kStored = false;
    static constexpr bool kPrintedAnyway = true;
    static constexpr uword kInitial = 0;
    static void Print(uword flags, OCIError*) { PrintDateCheckFlags(flags); }
};
