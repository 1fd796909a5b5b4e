// Numbers as the commands write, print and store them. Command thread only.
#pragma once

#include "commands/shared/value_operation.h"

// Reads an operand: the first element of the SQLT_VNU buffer of that name, else the word as a literal. Returns 0, the
// library's return code, which has been reported, or -1 (or a conversion's code) after a message.
int ConvertStringToNumber(const char* word, OCIError* error, OCINumber& number);

// Prints the number, rounded to five places, on a line of its own. A failure is reported instead.
void PrintNumber(const OCINumber& value, OCIError* error);

// Copies the number into the first element of the SQLT_VNU buffer that the word names. "null" stores nothing; any other
// word that names no such buffer is complained about.
void StoreNumberResult(const char* word, const OCINumber& value);

inline constexpr OCINumber kZeroNumber = {{1, 128}};

// "null" passes a null pointer.
template <> class Operand<const OCINumber*> {
public:
    bool Resolve(const char* word, ErrorWord& error) {
        is_null_ = IsNull(word);
        OCIError* const handle = error.Get();
        return is_null_ || ConvertStringToNumber(word, handle, value_) == 0;
    }
    const OCINumber* Argument() const { return is_null_ ? nullptr : &value_; }
    // For a function that changes its operand: a named buffer never sees it.
    OCINumber* Copy() { return is_null_ ? nullptr : &value_; }

private:
    OCINumber value_;
    bool is_null_ = false;
};
using NumberOperand = Operand<const OCINumber*>;

template <> struct ResultForm<OCINumber> {
    static constexpr bool kStored = true;
    static constexpr bool kPrintedAnyway = false;
    static constexpr OCINumber kInitial = kZeroNumber;
    static void Print(const OCINumber& value, OCIError* error) { PrintNumber(value, error); }
    static void Store(const char* word, const OCINumber& value) { StoreNumberResult(word, value); }
};
