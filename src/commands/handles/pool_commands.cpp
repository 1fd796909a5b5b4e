// Session and connection pools, and sessions out of them. The name that the library gives a pool is kept with the pool
// handle: later logons find it under the handle's name. Command thread only.
#include <string>

#include "commands/families.h"
#include "commands/shared/handle_call.h"
#include "commands/shared/pool_name.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/text_conversion.h"

namespace {

// --- Creating --------------------------------------------------------------------------------------------------------

// The numbers of a pool, as the line has them: least, most, step.
struct PoolSize {
    explicit PoolSize(char** words)
        : least(DecodeCount(words[0])), most(DecodeCount(words[1])), step(DecodeCount(words[2])) {}
    ub4 least, most, step;
};

struct PoolTexts {
    // "database length min max increment user length password length"
    bool Set(char** words) {
        return database.SetWords(words) && user.SetWords(words + 5) &&
               SetPassword(password, words[7], DecodeLong(words[8]));
    }
    TextArgument database, user, password;
};

// Where the library tells the pool's name; the words may refuse either place.
struct PoolNamePlaces {
    OraText** text;
    ub4* length;
};

struct PoolCreation : CommandRow {
    Kind kind;
    const KeywordTable* modes;
    sword (*call)(OCIEnv* environment, OCIError* error, void* pool, const PoolNamePlaces& name, const PoolTexts& texts,
                  const PoolSize& size, ub4 mode);
};

// The library's text may go at any time, so it is copied. Of a text without a length nothing can be kept.
void KeepPoolName(const PoolCreation& row, const char* word, const OraText* name, ub4 length) {
    auto* const pool = static_cast<NamedPool*>(FindByName(row.kind, word));
    if (pool == nullptr || name == nullptr) return;
    pool->pool_name.assign(reinterpret_cast<const char*>(name), length);
}

void CreatePool(const PoolCreation& row, int, char** words) {
    auto* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    void* const pool = ResolveObject(row.kind, words[3]);
    OraText* name = nullptr;
    ub4 length = 0;
    const PoolNamePlaces places = {IsNull(words[4]) ? nullptr : &name, IsNull(words[5]) ? nullptr : &length};
    PoolTexts texts;
    if (!texts.Set(words + 6)) return;
    const PoolSize size(words + 8);
    const ub4 mode = DecodeStatementMode(words[15], row.modes);
    const sword rc = row.call(environment, error, pool, places, texts, size, mode);
    TraceAndReport(row.code, words[3], error, rc);
    if (rc == OCI_SUCCESS) KeepPoolName(row, words[3], name, length);
}

constexpr KeywordTable kConnectionPoolModes[] = {
    {"oci_default", 0}, {"oci_cpool_reinitialize", 0x111}, kEndOfKeywords};

constexpr PoolCreation kPoolCreations[] = {
    {{Code::ociconnectionpoolcreate, Words(16),
      "OCIConnectionPoolCreate envhp errhp poolhp poolName poolNameLen dblink dblinkLen connMin connMax connIncr "
      "userid useridLen password passwordLen mode"},
     Kind::cpool, kConnectionPoolModes,
     [](OCIEnv* environment, OCIError* error, void* pool, const PoolNamePlaces& name, const PoolTexts& texts,
        const PoolSize& size, ub4 mode) {
         return Call(&ClientLibrary::OCIConnectionPoolCreate, environment, error, static_cast<OCICPool*>(pool),
                     name.text, reinterpret_cast<sb4*>(name.length), texts.database.Text(),
                     static_cast<sb4>(texts.database.Length()), size.least, size.most, size.step, texts.user.Text(),
                     static_cast<sb4>(texts.user.Length()), texts.password.Text(),
                     static_cast<sb4>(texts.password.Length()), mode);
     }},
    {{Code::ocisessionpoolcreate, Words(16),
      "OCISessionPoolCreate envhp errhp spoolhp poolName poolNameLen connStr connStrLen sessMin sessMax sessIncr "
      "userid useridLen password passwordLen mode"},
     Kind::spool, SessionPoolKeywords,
     [](OCIEnv* environment, OCIError* error, void* pool, const PoolNamePlaces& name, const PoolTexts& texts,
        const PoolSize& size, ub4 mode) {
         return Call(&ClientLibrary::OCISessionPoolCreate, environment, error, static_cast<OCISPool*>(pool), name.text,
                     name.length, texts.database.Text(), texts.database.Length(), size.least, size.most, size.step,
                     texts.user.Text(), texts.user.Length(), texts.password.Text(), texts.password.Length(), mode);
     }},
};

// --- Destroying ------------------------------------------------------------------------------------------------------

sword ForgetPoolName(Kind kind, const char* word, sword rc) {
    auto* const pool = static_cast<NamedPool*>(FindByName(kind, word));
    if (rc == OCI_SUCCESS && pool != nullptr) pool->pool_name.clear();
    return rc;
}

constexpr KeywordTable kDestroyModes[] = {{"oci_default", 0}, kEndOfKeywords};

constexpr HandleCall kPoolCalls[] = {
    {{Code::ociconnectionpooldestroy, Words(4), "OCIConnectionPoolDestroy poolhp errhp mode"}, Kind::cpool, Kind::cpool,
     [](void* pool, OCIError* error, char** words) {
         const ub4 mode = DecodeStatementMode(words[3], kDestroyModes);
         return ForgetPoolName(Kind::cpool, words[1],
                               Call(&ClientLibrary::OCIConnectionPoolDestroy, static_cast<OCICPool*>(pool), error,
                                    mode));
     }},
    // Its modes have no keywords.
    {{Code::ocisessionpooldestroy, Words(4), "OCISessionPoolDestroy spoolhp errhp mode"}, Kind::spool, Kind::spool,
     [](void* pool, OCIError* error, char** words) {
         return ForgetPoolName(Kind::spool, words[1],
                               Call(&ClientLibrary::OCISessionPoolDestroy, static_cast<OCISPool*>(pool), error,
                                    DecodeCount(words[3])));
     }},
};

// --- Sessions --------------------------------------------------------------------------------------------------------

// The tag that a session came with; none without a place for its length.
void PrintTag(const OraText* tag, ub4 length) {
    if (tag == nullptr || length == 0) return;
    Line line;
    if (AddText(line, tag, length, Utf16Mode)) line.Character('\n').Print();
}

void GetSession(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    if (CheckInUse(Kind::svc, words[3])) return;
    NewObject<OCISvcCtx> svc(words[3]);
    auto* const credentials = Resolve<OCIAuthInfo>(Kind::session, words[4]);
    TextArgument database, tag;
    if (!database.SetWords(words + 5) || !tag.SetWords(words + 7)) return;
    OraText* returned_tag = nullptr;
    ub4 returned_length = 0;
    boolean found = FALSE;
    boolean* const found_place = Place(found, count, words, 11);
    const ub4 mode = DecodeMode(words[12], SessionGetKeywords);
    UsePoolName(database, words[5], mode, kSessionPoolModes);
    const sword rc = Call(&ClientLibrary::OCISessionGet, handles.environment, handles.error, svc.Place(), credentials,
                          database.Text(), database.Length(), tag.Text(), tag.Length(),
                          Place(returned_tag, count, words, 9), Place(returned_length, count, words, 10), found_place,
                          mode);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc != OCI_SUCCESS) return;
    if (found_place != nullptr) {
        Message(kOutput, "found - %ld\n", static_cast<long>(found));
        PrintTag(returned_tag, returned_length);
    }
    svc.Enter(Kind::svc, handles.environment);
}

void ReleaseSession(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    TextArgument tag;
    if (!tag.SetWords(words + 3)) return;
    const ub4 mode = DecodeStatementMode(words[5], SessionReleaseKeywords);
    const sword rc = Call(&ClientLibrary::OCISessionRelease, svc, error, tag.Text(), tag.Length(), mode);
    TraceAndReport(row.code, words[1], error, rc);
}

constexpr PlainCommand kSessionCommands[] = {
    {{Code::ocisessionget, Words(13),
      "OCISessionGet envhp errhp svchp authInfop dbName dbName_len tagInfo tagInfo_len retTagInfo retTagInfo_len "
      "found mode"},
     GetSession},
    {{Code::ocisessionrelease, Words(6), "OCISessionRelease svchp errhp tag tag_len mode"}, ReleaseSession},
};

}  // namespace

void AddPoolCommands(HandlerTable& handlers) {
    handlers.Add<CreatePool>(kPoolCreations);
    handlers.Add<RunHandleCall>(kPoolCalls);
    handlers.Add(kSessionCommands);
}
