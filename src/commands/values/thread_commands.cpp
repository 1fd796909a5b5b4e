// The commands of the library's thread package. Its objects (mutexes, keys, thread identifiers, thread handles) are
// named alike, so a row and the type of its function say what a command does.
#include <cstring>
#include <string>

#include "commands/families.h"
#include "commands/shared/handle_call.h"
#include "commands/values/thread_child.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/registry.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

template <class Object> constexpr Kind kKind = Kind::mutex;
template <> constexpr Kind kKind<OCIThreadKey> = Kind::key;
template <> constexpr Kind kKind<OCIThreadId> = Kind::tid;
template <> constexpr Kind kKind<OCIThreadHandle> = Kind::thnd;

template <class Object> Object* Find(const char* word) {
    return Resolve<Object>(kKind<Object>, word);
}

// --- The process and the package -------------------------------------------------------------------------------------

void RunProcessInit(const CommandRow& row, int, char**) {
    Call(&ClientLibrary::OCIThreadProcessInit);
    outputOCI(row.code, OCI_SUCCESS, "");
    Message(kOutput, "OCIThreadProcessInit called\n");
}

void RunIsMulti(const CommandRow& row, int, char**) {
    const boolean is_multi = Call(&ClientLibrary::OCIThreadIsMulti);
    outputOCI(row.code, OCI_SUCCESS, "");
    Message(kOutput, "OCIThreadIsMulti %d\n", is_multi);
}

constexpr PackageCall kPackageCalls[] = {
    {{Code::ocithreadinit, Words(3), "OCIThreadInit hEnv hError"}, &ClientLibrary::OCIThreadInit},
    {{Code::ocithreadterm, Words(3), "OCIThreadTerm hEnv hError"}, &ClientLibrary::OCIThreadTerm},
};

// --- Making and destroying named objects -----------------------------------------------------------------------------

template <class Object> struct Making : CommandRow {
    LibraryFunction<sword(void*, OCIError*, Object**)> ClientLibrary::*function;
};
constexpr Making<OCIThreadMutex> kMutexMaking[] = {
    {{Code::ocithreadmutexinit, Words(4), "OCIThreadMutexInit hEnv hError mutex"}, &ClientLibrary::OCIThreadMutexInit},
};
constexpr Making<OCIThreadId> kIdMaking[] = {
    {{Code::ocithreadidinit, Words(4), "OCIThreadIdInit hEnv hError tid"}, &ClientLibrary::OCIThreadIdInit},
};
constexpr Making<OCIThreadHandle> kHandleMaking[] = {
    {{Code::ocithreadhndinit, Words(4), "OCIThreadHndInit hEnv hError thnd"}, &ClientLibrary::OCIThreadHndInit},
};

// `make` is the call, given the handles and the place of the new object.
template <class Object, class Function> void Make(Code code, char** words, Function make) {
    const EnvironmentAndError handles(words);
    const char* const name = words[3];
    if (CheckInUse(kKind<Object>, name)) return;
    NewObject<Object> object(name, NullName::is_refused);
    const sword rc = make(handles, object.Place());
    TraceAndReport(code, name, handles.error, rc);
    if (rc == OCI_SUCCESS) object.Enter(kKind<Object>, handles.environment);
}
template <class Object> void RunMaking(const Making<Object>& row, int, char** words) {
    Make<Object>(row.code, words, [&](const EnvironmentAndError& handles, Object** place) {
        return Call(row.function, handles.environment, handles.error, place);
    });
}
// A fifth word, whatever it is, installs the destructor.
void RunKeyInit(const CommandRow& row, int count, char** words) {
    const OCIThreadKeyDestFunc destructor = count == 5 ? MyThreadKeyDescructor : nullptr;
    Make<OCIThreadKey>(row.code, words, [=](const EnvironmentAndError& handles, OCIThreadKey** place) {
        return Call(&ClientLibrary::OCIThreadKeyInit, handles.environment, handles.error, place, destructor);
    });
}

template <class Object> struct Destroying : Making<Object> {};
constexpr Destroying<OCIThreadMutex> kMutexDestroying[] = {
    {{{Code::ocithreadmutexdestroy, Words(4), "OCIThreadMutexDestroy hEnv hError mutex"},
      &ClientLibrary::OCIThreadMutexDestroy}},
};
constexpr Destroying<OCIThreadKey> kKeyDestroying[] = {
    {{{Code::ocithreadkeydestroy, Words(4), "OCIThreadKeyDestroy hEnv hError key"},
      &ClientLibrary::OCIThreadKeyDestroy}},
};
constexpr Destroying<OCIThreadId> kIdDestroying[] = {
    {{{Code::ocithreadiddestroy, Words(4), "OCIThreadIdDestroy hEnv hError tid"}, &ClientLibrary::OCIThreadIdDestroy}},
};
constexpr Destroying<OCIThreadHandle> kHandleDestroying[] = {
    {{{Code::ocithreadhnddestroy, Words(4), "OCIThreadHndDestroy hEnv hError thnd"},
      &ClientLibrary::OCIThreadHndDestroy}},
};
template <class Object> void RunDestroying(const Destroying<Object>& row, int, char** words) {
    const EnvironmentAndError handles(words);
    Object* object = Find<Object>(words[3]);
    const sword rc = Call(row.function, handles.environment, handles.error, &object);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc == OCI_SUCCESS) Release(kKind<Object>, words[3]);
}

// --- Using one object ------------------------------------------------------------------------------------------------

template <class Object> struct Use : CommandRow {
    LibraryFunction<sword(void*, OCIError*, Object*)> ClientLibrary::*function;
};
constexpr Use<OCIThreadMutex> kMutexUses[] = {
    {{Code::ocithreadmutexacquire, Words(4), "OCIThreadMutexAcquire hEnv hError mutex"},
     &ClientLibrary::OCIThreadMutexAcquire},
    {{Code::ocithreadmutexrelease, Words(4), "OCIThreadMutexRelease hEnv hError mutex"},
     &ClientLibrary::OCIThreadMutexRelease},
};
constexpr Use<OCIThreadId> kIdUses[] = {
    {{Code::ocithreadidget, Words(4), "OCIThreadIdGet hEnv hError tid"}, &ClientLibrary::OCIThreadIdGet},
    {{Code::ocithreadidsetnull, Words(4), "OCIThreadIdSetNull hEnv hError tid"}, &ClientLibrary::OCIThreadIdSetNull},
};
constexpr Use<OCIThreadHandle> kHandleUses[] = {
    {{Code::ocithreadhandleget, Words(4), "OCIThreadHandleGet hEnv hError thnd"}, &ClientLibrary::OCIThreadHandleGet},
    {{Code::ocithreadclose, Words(4), "OCIThreadClose hEnv hError thnd"}, &ClientLibrary::OCIThreadClose},
    {{Code::ocithreadjoin, Words(4), "OCIThreadJoin hEnv hError thnd"}, &ClientLibrary::OCIThreadJoin},
};
template <class Object> void RunUse(const Use<Object>& row, int, char** words) {
    const EnvironmentAndError handles(words);
    Object* const object = Find<Object>(words[3]);
    TraceAndReport(row.code, words[3], handles.error, Call(row.function, handles.environment, handles.error, object));
}

// --- Values of keys --------------------------------------------------------------------------------------------------

// Where a key's text lies: in its slot, since the library hands it out until the key is set anew. Keys without a name
// share one place.
auto& KeyTextOf(const char* key) {
    static NamedKey unnamed;
    NamedKey* const named = AsRecord<Kind::key>(FindByName(Kind::key, key));
    return named == nullptr ? unnamed.text : named->text;
}

// A call that fails leaves the key its old text.
void RunKeySet(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIThreadKey* const key = Find<OCIThreadKey>(words[3]);
    auto& text = KeyTextOf(words[3]);
    const std::string old(text, sizeof text);
    if (!IsNull(words[4])) std::strncpy(text, words[4], sizeof text - 1);
    const sword rc = Call(&ClientLibrary::OCIThreadKeySet, handles.environment, handles.error, key,
                          IsNull(words[4]) ? nullptr : text);
    if (rc != OCI_SUCCESS) old.copy(text, sizeof text);
    TraceAndReport(row.code, words[3], handles.error, rc);
}

void RunKeyGet(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIThreadKey* const key = Find<OCIThreadKey>(words[3]);
    void* value = nullptr;
    void** const place = Place(value, count, words, 4);
    const sword rc = Call(&ClientLibrary::OCIThreadKeyGet, handles.environment, handles.error, key, place);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc != OCI_SUCCESS || place == nullptr) return;
    Message(kOutput, "OCIThreadKeyGet - %s\n", value == nullptr ? "null" : static_cast<const char*>(value));
}

// --- Thread identifiers ----------------------------------------------------------------------------------------------

void RunIdSet(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    auto* const target = Find<OCIThreadId>(words[3]);
    auto* const source = Find<OCIThreadId>(words[4]);
    const sword rc = Call(&ClientLibrary::OCIThreadIdSet, handles.environment, handles.error, target, source);
    TraceAndReport(row.code, words[3], handles.error, rc);
}

void RunIdSame(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    auto* const left = Find<OCIThreadId>(words[3]);
    auto* const right = Find<OCIThreadId>(words[4]);
    boolean same = FALSE;
    boolean* const place = Place(same, count, words, 5);
    const sword rc = Call(&ClientLibrary::OCIThreadIdSame, handles.environment, handles.error, left, right, place);
    TraceAndReport(row.code, words[1], handles.error, rc);
    if (rc == OCI_SUCCESS && place != nullptr) Message(kOutput, "OCIThreadIdSame - %d\n", same);
}

void RunIdNull(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    auto* const identifier = Find<OCIThreadId>(words[3]);
    boolean is_null = FALSE;
    boolean* const place = Place(is_null, count, words, 4);
    const sword rc = Call(&ClientLibrary::OCIThreadIdNull, handles.environment, handles.error, identifier, place);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc == OCI_SUCCESS && place != nullptr) Message(kOutput, "OCIThreadIdNull - %d\n", is_null);
}

// --- Threads ---------------------------------------------------------------------------------------------------------

void RunCreate(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    const OCIThreadStartFunction start = IsNull(words[3]) ? nullptr : ChildThread;
    auto* const key = Find<OCIThreadKey>(words[4]);
    auto* const identifier = Find<OCIThreadId>(words[5]);
    auto* const thread = Find<OCIThreadHandle>(words[6]);
    SetChildHandles(DefaultEnvironment, DefaultErrorHandle);
    const sword rc = Call(&ClientLibrary::OCIThreadCreate, handles.environment, handles.error, start, key, identifier,
                          thread);
    TraceAndReport(row.code, words[6], handles.error, rc);
}

constexpr PlainCommand kOtherThreadCommands[] = {
    {{Code::ocithreadprocessinit, Words(1), "OCIThreadProcessInit"}, RunProcessInit},
    {{Code::ocithreadismulti, Words(1), "OCIThreadIsMulti"}, RunIsMulti},
    {{Code::ocithreadkeyinit, WordsBetween(4, 5), "OCIThreadKeyInit hEnv hError key [destFn]"}, RunKeyInit},
    {{Code::ocithreadkeyset, Words(5), "OCIThreadKeySet hEnv hError key value"}, RunKeySet},
    {{Code::ocithreadkeyget, WordsBetween(4, 5), "OCIThreadKeyGet hEnv hError key [value]"}, RunKeyGet},
    {{Code::ocithreadidnull, WordsBetween(4, 5), "OCIThreadIdNull hEnv hError tid [result]"}, RunIdNull},
    {{Code::ocithreadidsame, WordsBetween(5, 6), "OCIThreadIdSame hEnv hError tid1 tid2 [result]"}, RunIdSame},
    {{Code::ocithreadidset, Words(5), "OCIThreadIdSet hEnv hError tidDest tidSrc"}, RunIdSet},
    {{Code::ocithreadcreate, Words(7), "OCIThreadCreate hEnv hError child key tid thnd"}, RunCreate},
};

}  // namespace

void AddThreadCommands(HandlerTable& handlers) {
    handlers.Add<RunPackageCall>(kPackageCalls);
    handlers.Add<RunMaking<OCIThreadMutex>>(kMutexMaking);
    handlers.Add<RunMaking<OCIThreadId>>(kIdMaking);
    handlers.Add<RunMaking<OCIThreadHandle>>(kHandleMaking);
    handlers.Add<RunDestroying<OCIThreadMutex>>(kMutexDestroying);
    handlers.Add<RunDestroying<OCIThreadKey>>(kKeyDestroying);
    handlers.Add<RunDestroying<OCIThreadId>>(kIdDestroying);
    handlers.Add<RunDestroying<OCIThreadHandle>>(kHandleDestroying);
    handlers.Add<RunUse<OCIThreadMutex>>(kMutexUses);
    handlers.Add<RunUse<OCIThreadId>>(kIdUses);
    handlers.Add<RunUse<OCIThreadHandle>>(kHandleUses);
    handlers.Add(kOtherThreadCommands);
}
