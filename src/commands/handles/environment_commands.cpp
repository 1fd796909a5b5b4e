// Making environments, initialising and ending the library. Memory callbacks say when the library calls them.
// Command thread only, but for the callbacks, which run in any.
#include <algorithm>
#include <optional>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/memory.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

namespace {

// --- Memory callbacks ------------------------------------------------------------------------------------------------

void SayCalled(const char* callback, const void* context) {
    const char* text = context == nullptr ? "(null)" : static_cast<const char*>(context);
    Message(kOutput, "%s - Called by OCI - %s\n", callback, text);
}

void* MyMalloc(void* context, size_t size) {
    SayCalled("MyMalloc", context);
    return GetMem(size);
}

// What the old block held is dropped: a library that counts on it is to be found out.
void* MyRealloc(void* context, void* old_block, size_t size) {
    SayCalled("MyRealloc", context);
    FreeMem(old_block);
    return GetMem(size);
}

void MyFree(void* context, void* block) {
    SayCalled("MyFree", context);
    FreeMem(block);
}

struct Callbacks {
    void* context = nullptr;
    OCIAllocFunction allocate = nullptr;
    OCIReallocFunction reallocate = nullptr;
    OCIFreeFunction free = nullptr;
};

// --- Environments ----------------------------------------------------------------------------------------------------

// A form of a line: its word count, and where the words behind the mode stand.
struct EnvironmentForm {
    int count;
    std::optional<int> context;  // the first of "ctxp mallocp reallocp freep", and the only one whose text matters
    std::optional<int> extra;    // where "[extramem [null]]" would stand; without, the library is given no place
    bool size_is_read = true;
};
constexpr EnvironmentForm kEnvironmentForms[] = {
    {.count = 3, .context = {}, .extra = {}},
    {.count = 4, .context = {}, .extra = 3},
    {.count = 5, .context = {}, .extra = 3},
    {.count = 7, .context = 3, .extra = 7},
    {.count = 8, .context = 3, .extra = 7},
    // In its longest form the command does not read the extramem word. It never has, and scripts count on it.
    {.count = 9, .context = 3, .extra = 7, .size_is_read = false},
};

const EnvironmentForm& FormOf(int count) {
    return *std::ranges::find(kEnvironmentForms, count, &EnvironmentForm::count);
}

Callbacks CallbacksOf(const EnvironmentForm& form, char** words) {
    if (!form.context) return {};
    return {ContextOf(words[*form.context]), MyMalloc, MyRealloc, MyFree};
}

ExtraMemory ExtraMemoryOf(const EnvironmentForm& form, char** words) {
    if (!form.extra) return ExtraMemory::None();
    ExtraMemory extra(form.count - *form.extra, words + *form.extra);
    if (!form.size_is_read) extra.DropSize();
    return extra;
}

struct EnvironmentMaker : CommandRow {
    sword (*make)(OCIEnv** place, ub4 mode, const Callbacks& callbacks, ExtraMemory& extra);
    bool always_current;  // becomes the current environment; else only where there is none
};

void MakeEnvironment(const EnvironmentMaker& row, int count, char** words) {
    if (CheckInUse(Kind::environment, words[1])) return;
    NewObject<OCIEnv> environment(words[1]);
    const ub4 mode = DecodeMode(words[2]);
    if ((mode & OCI_UTF16) != 0) Utf16Mode = true;
    const EnvironmentForm& form = FormOf(count);
    ExtraMemory extra = ExtraMemoryOf(form, words);
    const sword rc = row.make(environment.Place(), mode, CallbacksOf(form, words), extra);
    outputOCI(row.code, rc, words[1]);
    EnvironmentReport(environment.Get(), rc);
    if (rc != OCI_SUCCESS) return;
    environment.Enter(Kind::environment, nullptr);
    if (row.always_current || DefaultEnvironment == nullptr) DefaultEnvironment = environment.Get();
}

constexpr EnvironmentMaker kEnvironmentMakers[] = {
    {{Code::ocienvcreate, Words(3, 4, 5, 7, 8, 9),
      "OCIEnvCreate myhenv mode [ctxp mallocp reallocp freep] [extramem [null]]"},
     [](OCIEnv** place, ub4 mode, const Callbacks& callbacks, ExtraMemory& extra) {
         return Call(&ClientLibrary::OCIEnvCreate, place, mode, callbacks.context, callbacks.allocate,
                     callbacks.reallocate, callbacks.free, extra.Size(), extra.Place());
     },
     true},
    {{Code::ocienvinit, Words(3, 4, 5), "OCIEnvInit myhenv mode [extramem [null]]"},
     [](OCIEnv** place, ub4 mode, const Callbacks&, ExtraMemory& extra) {
         return Call(&ClientLibrary::OCIEnvInit, place, mode, extra.Size(), extra.Place());
     },
     false},
};

// Whether every count that the dispatcher lets through has a form.
constexpr bool HasForms(const EnvironmentMaker& maker) {
    for (int count = 0; count < 64; ++count)
        if (maker.words.Has(count) && std::ranges::count(kEnvironmentForms, count, &EnvironmentForm::count) != 1)
            return false;
    return true;
}
static_assert(std::ranges::all_of(kEnvironmentMakers, HasForms));

// --- The process -----------------------------------------------------------------------------------------------------

// The context is always the same here, whatever its word.
void Initialize(const CommandRow& row, int count, char** words) {
    Callbacks callbacks;
    if (count > 2) callbacks = {callback_context, MyMalloc, MyRealloc, MyFree};
    const sword rc = Call(&ClientLibrary::OCIInitialize, DecodeMode(words[1]), callbacks.context, callbacks.allocate,
                          callbacks.reallocate, callbacks.free);
    outputOCI(row.code, rc, "");
    EnvironmentReport(nullptr, rc);
}

// The report comes before the trace. The memory count is printed and UTF-16 mode ends after a wrong word count, too.
void Terminate(const CommandRow& row, int count, char** words) {
    if (count == 2) {
        const sword rc = Call(&ClientLibrary::OCITerminate, DecodeMode(words[1]));
        EnvironmentReport(DefaultEnvironment, rc);
        outputOCI(row.code, rc, "");
    } else {
        InvalidSyntax(row.usage);
    }
    const sb4 blocks = Call(&ClientLibrary::OCI_memGetMemCount);
    if (blocks != 0) Message(kOutput, "Memory count - %ld\n", static_cast<long>(blocks));
    Utf16Mode = false;
}

constexpr PlainCommand kProcessCommands[] = {
    {{Code::ociinitialize, Words(2, 6), "OCIInitialize mode [ctxp mallocp reallocp freep]"}, Initialize},
    {{Code::ociterminate, kAnyWords, "OCITerminate mode"}, Terminate},
};

}  // namespace

void AddEnvironmentCommands(HandlerTable& handlers) {
    handlers.Add<MakeEnvironment>(kEnvironmentMakers);
    handlers.Add(kProcessCommands);
}
