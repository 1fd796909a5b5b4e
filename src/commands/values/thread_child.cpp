// The routines that run in threads of a script.
#include "commands/values/thread_child.h"

#include <atomic>

#include "core/messages.h"
#include "platform/client_library.h"
#include "report/return_code.h"

namespace {

std::atomic<OCIEnv*> child_environment;
std::atomic<OCIError*> child_error;

// The value that this thread has given its key: an identifier, not a text, and gone by the time the destructor sees it.
thread_local const void* own_identifier = nullptr;

// False after a failure, which has been reported.
bool MakeIdentifier(OCIEnv* environment, OCIError* error, OCIThreadId*& identifier) {
    sword rc = Call(&ClientLibrary::OCIThreadIdInit, environment, error, &identifier);
    if (rc == OCI_SUCCESS) rc = Call(&ClientLibrary::OCIThreadIdGet, environment, error, identifier);
    if (rc != OCI_SUCCESS) ReturnCodeReport(error, rc);
    return rc == OCI_SUCCESS;
}

void CheckKey(OCIEnv* environment, OCIError* error, OCIThreadKey* key, OCIThreadId* identifier) {
    if (Call(&ClientLibrary::OCIThreadKeySet, environment, error, key, identifier) != OCI_SUCCESS)
        Message(kError, "Could not set value for key\n");
    void* value = nullptr;
    if (Call(&ClientLibrary::OCIThreadKeyGet, environment, error, key, &value) != OCI_SUCCESS)
        Message(kError, "Could not retrieve value for key\n");
    else if (value != identifier) Message(kError, "Incorrect value from key after setting it\n");
}

}  // namespace

void SetChildHandles(OCIEnv* environment, OCIError* error) {
    child_environment = environment;
    child_error = error;
}

void ChildThread(void* key) {
    OCIEnv* const environment = child_environment;
    OCIError* const error = child_error;
    OCIThreadId* identifier = nullptr;
    if (!MakeIdentifier(environment, error, identifier)) return;
    own_identifier = identifier;
    CheckKey(environment, error, static_cast<OCIThreadKey*>(key), identifier);
    Call(&ClientLibrary::OCIThreadIdDestroy, environment, error, &identifier);
}

void MyThreadKeyDescructor(void* value) {
    const char* text = static_cast<const char*>(value);
    if (value == nullptr) text = "(null)";
    else if (value == own_identifier) text = "(thread identifier)";
    Message(kOutput, "MyThreadKeyDescructor - Called by OCI - %s\n", text);
}
