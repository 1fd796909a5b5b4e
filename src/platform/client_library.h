// The client library as the driver sees it: a table of its functions, and Call, the one door through which every call
// of the driver goes. The library is loaded at the first call; client_library.cpp tells which one. Nothing is printed
// here: what is missing is told to the function given to SetLoaderComplaint.
//
//   const sword rc = Call(&ClientLibrary::OCIStmtFetch2, stmt, err, rows, orientation, offset, mode);
//   const int result = Call(&xa_switch_t::xa_start_entry, &xid, rmid, flags);
//
// The first call comes from the command thread; after it, calls may come from any thread.
#pragma once

#include <type_traits>

#include "kelpci.h"
#include "oci.h"
#include "xa.h"

// What a call does where the library has no such function. Those that only our own library exports pass in silence.
enum class Missing { complains_and_answers_error, complains_and_answers_zero, answers_error, answers_zero };

template <class Signature>
struct LibraryFunction {
    const char* name;
    Missing missing = Missing::complains_and_answers_error;
    Signature* pointer = nullptr;    // null: not loaded yet, or not exported
};

struct ClientLibrary {
#define FUNCTION(symbol) LibraryFunction<decltype(::symbol)> symbol{#symbol};
#define FUNCTION_WITH(symbol, missing) LibraryFunction<decltype(::symbol)> symbol{#symbol, Missing::missing};
#include "platform/client_functions.def"
#undef FUNCTION
};

extern ClientLibrary client_library;

// Takes complaints, one text with its line feed at a time: the library cannot be loaded (once), or does not export a
// function (at each call). Without it they are dropped.
using LoaderComplaint = void (*)(const char* text);
void SetLoaderComplaint(LoaderComplaint complain);

// Loads the library; does nothing from the second time on. Call needs no help of it.
void LoadClientLibrary();

// The library's XA switch; null after a complaint when it has none. Loads the library.
xa_switch_t* XaSwitch();

// Forgets the library and the failures, so that the next call loads anew; what was loaded stays loaded. For tests.
void ForgetClientLibrary();

// Complains, if that is called for, that the loaded library has no such function. Says nothing where the library itself
// is missing. Answers what a call answers whose result is an int.
int CallMissing(const char* name, Missing missing);

// Whether the library exports the function, or one that stands in for it. Loads the library, complains never.
template <class Signature>
bool Exports(LibraryFunction<Signature> ClientLibrary::*function) {
    LoadClientLibrary();
    return (client_library.*function).pointer != nullptr;
}

// The rare half of Call, kept out of it so that the call itself stays small.
template <class Result, class... Parameters>
[[gnu::noinline]] Result LoadAndCall(LibraryFunction<Result(Parameters...)> ClientLibrary::*function,
                                     Parameters... arguments) {
    LoadClientLibrary();
    const auto& entry = client_library.*function;
    if (entry.pointer) return entry.pointer(arguments...);
    const int result = CallMissing(entry.name, entry.missing);
    if constexpr (std::is_same_v<Result, int>) return result;
    else return Result();
}

template <class Result, class... Parameters>
inline Result Call(LibraryFunction<Result(Parameters...)> ClientLibrary::*function,
                   std::type_identity_t<Parameters>... arguments) {
    const auto& entry = client_library.*function;
    if (!entry.pointer) [[unlikely]] return LoadAndCall(function, arguments...);
    return entry.pointer(arguments...);
}

// An entry of the XA switch; XAER_RMFAIL when there is no switch or no such entry in it.
template <class... Parameters>
int Call(int (*xa_switch_t::*entry)(Parameters...), std::type_identity_t<Parameters>... arguments) {
    xa_switch_t* const xa = XaSwitch();
    return xa && xa->*entry ? (xa->*entry)(arguments...) : XAER_RMFAIL;
}
