// What the whole process shares: the current handles and modes. Set and read by the command thread; the atomic ones are
// read by reports in other threads, too.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>

struct OCIEnv;
struct OCIError;

extern OCIEnv* DefaultEnvironment;      // made most recently; used by commands that are given none
extern OCIError* DefaultErrorHandle;    // the first error handle made since the last one here was freed
inline void AdoptErrorHandle(OCIError* error) {
    if (DefaultErrorHandle == nullptr) DefaultErrorHandle = error;
}
inline void ForgetErrorHandle(const void* error) {
    if (DefaultErrorHandle == error) DefaultErrorHandle = nullptr;
}
extern std::atomic<bool> Utf16Mode;     // texts go to the library, and come from it, in UTF-16

extern uint32_t application_code_page;  // of the process, as the platform reports it
extern uint32_t second_code_page;       // stands in where the first is itself a Unicode one

extern std::string start_up_password;   // from the command line
extern bool password_given;
extern bool replace_password;           // logons take start_up_password for what the script says; set by `opt`
extern bool print_sql_function_code;    // set by `opt`

extern std::atomic<int> report_switch;  // 0 silences the return-code report; set by `setcallerroroci`
