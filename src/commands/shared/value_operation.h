// What the commands on numbers and on dates share: a library function that takes an error handle, some operands and the
// place of its result. The type of the function says how the words are read and what is done with the result; a row
// says which function it is. The words are the error handle, one word an operand, and an optional one for the result.
// Command thread only.
#pragma once

#include <tuple>

#include "core/command_table.h"
#include "core/keywords.h"
#include "core/messages.h"
#include "objects/registry.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

// The error handle, looked up when it is first needed. Numbers are read with its help, dates without: that decides
// which of two bad words is complained about first.
class ErrorWord {
public:
    explicit ErrorWord(const char* word) : word_(word) {}

    OCIError* Get() {
        if (word_ != nullptr) handle_ = ResolveError<OCIError>(word_);
        word_ = nullptr;
        return handle_;
    }

private:
    const char* word_;
    OCIError* handle_ = nullptr;
};

// A word that becomes an argument of type T. Resolve answers false when the command ends here, and has said why.
template <class T> class Operand;
template <> class Operand<int> {
public:
    bool Resolve(const char* word, ErrorWord&) {
        value_ = DecodeNumber(word);
        return true;
    }
    int Argument() const { return value_; }

private:
    int value_ = 0;
};

// What a result of type T starts as, how it is printed, and how it is stored under a word (kStored: whether it is).
// kPrintedAnyway: a success prints the local value even where the library was given no place to write to.
template <class T> struct ResultForm;
template <> struct ResultForm<int> {
    static constexpr bool kStored = false;
    static constexpr bool kPrintedAnyway = false;
    static constexpr int kInitial = 0;
    static void Print(int value, OCIError*) { Message(kOutput, "%d\n", value); }
};

// Where the library puts a result, by the optional word at `index`: "null" passes a null pointer, any other word names
// the buffer that a result to be stored goes to.
template <class T> class ResultPlace {
public:
    ResultPlace(int count, char** words, int index)
        : word_(count > index ? words[index] : nullptr), refused_(word_ != nullptr && IsNull(word_)) {}

    T* Pointer() { return refused_ ? nullptr : &value_; }
    const T& Value() const { return value_; }

    // After a call that succeeded.
    void PrintAndStore(OCIError* error) {
        if (!refused_ || ResultForm<T>::kPrintedAnyway) ResultForm<T>::Print(value_, error);
        if constexpr (ResultForm<T>::kStored)
            if (word_ != nullptr) ResultForm<T>::Store(word_, value_);  // "null" names no buffer
    }

private:
    const char* word_;  // null: there is none
    bool refused_;
    T value_ = ResultForm<T>::kInitial;
};

enum class Outcome {
    as_the_word_says,  // printed unless the word is "null", stored if a word is there
    printed            // always printed, never stored
};

template <class Result, class... Operands> struct ValueOperation : CommandRow {
    LibraryFunction<sword(OCIError*, Operands..., Result*)> ClientLibrary::*function;
    Outcome outcome = Outcome::as_the_word_says;
};

template <class... Operands> bool ResolveOperands(std::tuple<Operands...>& operands, char** words, ErrorWord& error) {
    return std::apply([&](auto&... operand) { return (operand.Resolve(*words++, error) && ...); }, operands);
}

// All that follows a call: trace, report and, after success, the result.
template <class T> void Conclude(Code code, OCIError* error, sword rc, ResultPlace<T>& result) {
    TraceAndReport(code, "", error, rc);
    if (rc == OCI_SUCCESS) result.PrintAndStore(error);
}

template <class Result, class... Operands>
void RunValueOperation(const ValueOperation<Result, Operands...>& row, int count, char** words) {
    ErrorWord error(words[1]);
    std::tuple<Operand<Operands>...> operands;
    if (!ResolveOperands(operands, words + 2, error)) return;
    ResultPlace<Result> result(count, words, 2 + sizeof...(Operands));
    const sword rc = std::apply(
        [&](const auto&... operand) {
            return Call(row.function, error.Get(), operand.Argument()..., result.Pointer());
        },
        operands);
    if (row.outcome == Outcome::as_the_word_says) return Conclude(row.code, error.Get(), rc, result);
    TraceAndReport(row.code, "", error.Get(), rc);
    if (rc == OCI_SUCCESS) ResultForm<Result>::Print(result.Value(), error.Get());
}
