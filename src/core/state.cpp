// The process-wide handles, modes and flags, as they are at start-up.
#include "core/state.h"

OCIEnv* DefaultEnvironment = nullptr;
OCIError* DefaultErrorHandle = nullptr;
std::atomic<bool> Utf16Mode = false;

uint32_t application_code_page = 0;
uint32_t second_code_page = 0;

std::string start_up_password;
bool password_given = false;
bool replace_password = false;
bool print_sql_function_code = false;

std::atomic<int> report_switch = 1;
