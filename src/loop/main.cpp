// The entry: start-up, the loop over standard input, the exit. Command thread only.
#include <csignal>
#include <cstring>

#include "core/messages.h"
#include "core/state.h"
#include "loop/script.h"
#include "platform/client_library.h"
#include "platform/code_page.h"

namespace {

constexpr const char* kBanner[] = {
    "harnix - interactive test driver for client libraries of the OCI call interface",
    "Copyright (c) the authors of harnix.",
    "All rights that are not granted in writing are reserved.",
    "The program is provided as it is, without warranty of any kind, express or",
    "implied; its authors are not liable for damage that arises from its use.",
    "All product names are the property of their respective owners.",
};

void FetchCodePages() {
    const int rc = GetProcessCodePage(&application_code_page, &second_code_page);
    if (rc != 0) Message(kError, "GetProcessCodePage failed with rc - %ld\n", static_cast<long>(rc));
}

// `harnix password` or `harnix -passwd password`. A lone "-passwd" is a password; anything else is ignored.
void TakePassword(int count, char** arguments) {
    const char* password = nullptr;
    if (count == 2) password = arguments[1];
    else if (count > 2 && std::strcmp(arguments[1], "-passwd") == 0) password = arguments[2];
    if (password == nullptr) return;
    start_up_password = password;
    password_given = true;
}

}  // namespace

int main(int count, char** arguments) {
    std::signal(SIGXFSZ, SIG_IGN);  // a file that may not grow fails the write, as a full disk does
    PrepareMessages();
    SetLoaderComplaint([](const char* text) { MessageText(kError, text); });
    FetchCodePages();
    TakePassword(count, arguments);
    for (const char* line : kBanner) Message(kOutput, "%s\n", line);
    ReadAndEvaluateScript(stdin);
    Message(kOutput, "\n");
    return 0;
}
