// Environments, handles and descriptors, logons, accounts, error records.
#include <cstring>
#include <filesystem>
#include <thread>
#include <vector>

#include "faults/scenarios.h"

namespace faults {
namespace {

void OwnEnvironment(World& w) {
    w.AtEnd([&w] {
        w.err = nullptr;
        return OCIHandleFree(std::exchange(w.env, nullptr), OCI_HTYPE_ENV);
    });
    w.err = w.New<OCIError>(OCI_HTYPE_ERROR);
}

void CreateEnvironment(World& w) {
    w.Step("OCIEnvCreate", [&] {
        return OCIEnvCreate(&w.env, w.mode, nullptr, ApplicationMemory::Allocate, nullptr, ApplicationMemory::Release,
                            16, nullptr);
    }, Told::code);
    OwnEnvironment(w);
}

void LogOffAtEnd(World& w) {
    w.AtEnd([&w] { return OCILogoff(std::exchange(w.svc, nullptr), w.err); });
}

void LogOn(World& w, std::string_view user, std::string_view password, std::string_view database) {
    w.STEP(OCILogon, w.env, w.err, &w.svc, user.empty() ? nullptr : World::Text(user), World::Size(user),
           user.empty() ? nullptr : World::Text(password), World::Size(password), World::Text(database),
           World::Size(database));
    LogOffAtEnd(w);
}

// A statement from nothing to its first row.
void FromNothing(World& w) {
    CreateEnvironment(w);
    LogOn(w, "", "", ":memory:");
    w.stmt = w.New<OCIStmt>(OCI_HTYPE_STMT);
    w.Prepare("select 'abc' from dual");
    char text[4] = "";
    w.Define(1, {text, 4, SQLT_STR});
    w.Execute(1);
    w.See(text);
}

// The older way in, and a logon that brings the statement cache along.
void InitializeAndLogOn2(World& w) {
    w.Step("OCIInitialize", [&] {
        return OCIInitialize(w.mode, nullptr, ApplicationMemory::Allocate, nullptr, ApplicationMemory::Release);
    }, Told::code);
    w.AtEnd([] { return OCITerminate(OCI_DEFAULT); });
    w.Step("OCIEnvInit", [&] { return OCIEnvInit(&w.env, OCI_DEFAULT, 16, nullptr); }, Told::code);
    OwnEnvironment(w);
    w.STEP(OCILogon2, w.env, w.err, &w.svc, nullptr, 0, nullptr, 0, World::Text(":memory:"), 8, OCI_LOGON2_STMTCACHE);
    LogOffAtEnd(w);
    w.STEP(OCIBreak, w.svc, w.err);
    w.STEP(OCIReset, w.svc, w.err);
    w.See(w.Attribute<ub4>(OCI_ATTR_STMTCACHESIZE, w.svc, OCI_HTYPE_SVCCTX));
}

// Frees what another thread made undisturbed: an end takes no memory, even as a thread's first call.
void FreeingTakesNoMemory(World& w) {
    OCIEnv* env = nullptr;
    dvoid* err = nullptr;
    dvoid* stmt = nullptr;
    dvoid* descriptor = nullptr;
    OCISvcCtx* svc = nullptr;
    std::thread([&] {
        OCIEnvCreate(&env, OCI_DEFAULT, nullptr, ApplicationMemory::Allocate, nullptr, ApplicationMemory::Release, 0,
                     nullptr);
        OCIHandleAlloc(env, &err, OCI_HTYPE_ERROR, 0, nullptr);
        auto* const error = static_cast<OCIError*>(err);
        OCILogon(env, error, &svc, nullptr, 0, nullptr, 0, World::Text(":memory:"), 8);
        OCIHandleAlloc(env, &stmt, OCI_HTYPE_STMT, 0, nullptr);
        OCIDescriptorAlloc(env, &descriptor, OCI_DTYPE_TIMESTAMP, 0, nullptr);
        auto* const query = static_cast<OCIStmt*>(stmt);
        OCIStmtPrepare(query, error, World::Text("select 1 from dual"), 18, OCI_NTV_SYNTAX, OCI_DEFAULT);
        EXPECT_EQ(OCIStmtExecute(svc, query, error, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS);
    }).join();
    w.SURELY(OCIDescriptorFree, descriptor, OCI_DTYPE_TIMESTAMP);
    w.Surely("OCIHandleFree of a statement", [&] { return OCIHandleFree(stmt, OCI_HTYPE_STMT); });
    w.SURELY(OCILogoff, svc, static_cast<OCIError*>(err));
    w.Surely("OCIHandleFree of the environment", [&] { return OCIHandleFree(env, OCI_HTYPE_ENV); });
    w.See("freed");
}

void HandlesAndDescriptors(World& w) {
    for (ub4 type = OCI_HTYPE_ERROR; type <= 29; ++type)
        if (type != OCI_HTYPE_BIND && type != OCI_HTYPE_DEFINE) w.New<dvoid>(type);
    for (const ub4 type : {OCI_DTYPE_LOB, OCI_DTYPE_ROWID, OCI_DTYPE_RSET, OCI_DTYPE_TIMESTAMP_TZ})
        w.NewDescriptor<dvoid>(type);
    static dvoid* array[5];
    w.Step("OCIArrayDescriptorAlloc", [&] {
        return OCIArrayDescriptorAlloc(w.env, array, OCI_DTYPE_DATE, 5, 8, nullptr);
    }, Told::environment);
    w.AtEnd([] { return OCIArrayDescriptorFree(array, OCI_DTYPE_DATE); });
    w.See("made");
}

// A server, a session and a context put together by hand, in UTF-16.
void AttachAndBegin(World& w) {
    auto* server = w.New<OCIServer>(OCI_HTYPE_SERVER);
    auto* session = w.New<OCISession>(OCI_HTYPE_SESSION);
    auto* svc = w.New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    w.Step("OCIServerAttach", [&] {
        const auto* name = reinterpret_cast<const OraText*>(u":memory:");
        return OCIServerAttach(server, w.err, name, 16, OCI_DEFAULT);
    });
    w.AtEnd([&w, server] { return OCIServerDetach(server, w.err, OCI_DEFAULT); });
    const struct { dvoid* on; ub4 type; dvoid* value; ub4 size; ub4 attribute; } set[] = {
        {svc, OCI_HTYPE_SVCCTX, server, 0, OCI_ATTR_SERVER},
        {session, OCI_HTYPE_SESSION, const_cast<char16_t*>(u"a name of eighteen"), 36, OCI_ATTR_USERNAME},
        {session, OCI_HTYPE_SESSION, const_cast<char16_t*>(u"password of eightn"), 36, OCI_ATTR_PASSWORD},
        {svc, OCI_HTYPE_SVCCTX, session, 0, OCI_ATTR_SESSION}};
    for (const auto& s : set) w.STEP(OCIAttrSet, s.on, s.type, s.value, s.size, s.attribute, w.err);
    w.STEP(OCISessionBegin, svc, w.err, session, OCI_CRED_EXT, OCI_DEFAULT);
    w.AtEnd([&w, svc, session] { return OCISessionEnd(svc, w.err, session, OCI_DEFAULT); });
    OraText* name = nullptr;
    ub4 length = 0;
    w.STEP(OCIAttrGet, session, OCI_HTYPE_SESSION, &name, &length, OCI_ATTR_USERNAME, w.err);
    w.See(length);
    w.STEP(OCIPing, svc, w.err, OCI_DEFAULT);
    OraText version[200];
    w.STEP(OCIServerVersion, svc, w.err, version, sizeof version, OCI_HTYPE_SVCCTX);
    w.See(version[0] != 0 ? "version" : "");
}

// The owner's account is made before, so that a failed logon or change is seen by the next.
void Account(World& w) {
    const std::string database = w.Folder() + "/accounts.db";
    OCISvcCtx* svc = nullptr;
    EXPECT_EQ(OCILogon(w.env, w.err, &svc, World::Text("ann"), 3, World::Text("one"), 3, World::Text(database),
                       World::Size(database)), OCI_SUCCESS);
    EXPECT_EQ(OCILogoff(svc, w.err), OCI_SUCCESS);
}

// Who owns the file is let in.
void SystemUser(World& w) {
    LogOn(w, "", "", w.Folder() + "/accounts.db");
    w.See("in");
}

void PasswordChange(World& w) {
    const std::string database = w.Folder() + "/accounts.db";
    const auto change = [&w](const char* from, const char* to) {
        return OCIPasswordChange(w.svc, w.err, World::Text("ann"), 3, World::Text(from), 3, World::Text(to), 3,
                                 OCI_DEFAULT);
    };
    LogOn(w, "ann", "one", database);
    Attempt([&] { w.Step("OCIPasswordChange", [&] { return change("one", "two"); }); },
            [&] { EXPECT_EQ(change("one", "one"), OCI_SUCCESS) << "it is still the old one"; });
    EXPECT_EQ(change("two", "one"), OCI_SUCCESS) << "it is the new one";
    w.See("changed");
}

// The first logon by name makes the database and its owner's account: both, or neither.
void FirstLogon(World& w) {
    const std::string database = w.Folder() + "/new.db";
    w.AtEnd([database] { return std::filesystem::remove(database), OCI_SUCCESS; });
    LogOn(w, "ann", "one", database);
    OCISvcCtx* other = nullptr;
    EXPECT_EQ(OCILogon(w.env, w.err, &other, World::Text("ann"), 3, World::Text("two"), 3, World::Text(database),
                       World::Size(database)), OCI_ERROR);
    w.See(w.Number(w.err, OCI_HTYPE_ERROR));
}

void MustRun(World& w, OCISvcCtx* svc, OCIStmt* stmt, std::string_view sql) {
    EXPECT_EQ(OCIStmtPrepare(stmt, w.err, World::Text(sql), World::Size(sql), OCI_NTV_SYNTAX, OCI_DEFAULT),
              OCI_SUCCESS);
    EXPECT_EQ(OCIStmtExecute(svc, stmt, w.err, 1, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS) << sql;
}

// The end of a session commits what is open, queries or not.
void LogoffCommits(World& w) {
    const std::string database = w.Folder() + "/logoff.db";
    const auto log_on = [&] {
        OCISvcCtx* svc = nullptr;
        EXPECT_EQ(OCILogon(w.env, w.err, &svc, nullptr, 0, nullptr, 0, World::Text(database), World::Size(database)),
                  OCI_SUCCESS);
        return svc;
    };
    dvoid *changing = nullptr, *reading = nullptr;
    OCIHandleAlloc(w.env, &changing, OCI_HTYPE_STMT, 0, nullptr);
    OCIHandleAlloc(w.env, &reading, OCI_HTYPE_STMT, 0, nullptr);
    w.AtEnd([changing] { return OCIHandleFree(changing, OCI_HTYPE_STMT); });
    w.AtEnd([reading] { return OCIHandleFree(reading, OCI_HTYPE_STMT); });
    auto* const change = static_cast<OCIStmt*>(changing);
    OCISvcCtx* svc = log_on();
    MustRun(w, svc, change, "create table if not exists t(a number)");
    MustRun(w, svc, change, "delete from t");
    MustRun(w, svc, change, "commit");
    MustRun(w, svc, change, "insert into t values(1)");
    sb4 number = 0;
    OCIDefine* define = nullptr;
    auto* const query = static_cast<OCIStmt*>(reading);
    OCIStmtPrepare(query, w.err, World::Text("select a from t"), 15, OCI_NTV_SYNTAX, OCI_DEFAULT);
    OCIDefineByPos(query, &define, w.err, 1, &number, 4, SQLT_INT, nullptr, nullptr, nullptr, OCI_DEFAULT);
    EXPECT_EQ(OCIStmtExecute(svc, query, w.err, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS);
    bool failed = false;
    try {
        w.STEP(OCILogoff, svc, w.err);
    } catch (const Stopped&) {
        failed = true;
        EXPECT_EQ(OCILogoff(svc, w.err), OCI_SUCCESS) << "again";
    }
    svc = log_on();
    MustRun(w, svc, change, "delete from t");
    ub4 rows = 0;
    OCIAttrGet(change, OCI_HTYPE_STMT, &rows, nullptr, OCI_ATTR_ROW_COUNT, w.err);
    EXPECT_EQ(OCILogoff(svc, w.err), OCI_SUCCESS);
    EXPECT_EQ(rows, 1u) << (failed ? "after a logoff that failed" : "after a logoff");
    if (failed) throw Stopped();
    w.See(static_cast<long>(rows));
}

// What is told of an error takes memory, too; without it there is the return code, and the record stays.
void ErrorTexts(World& w) {
    OCIStmtPrepare(w.stmt, w.err, World::Text("select * from missing"), 21, OCI_NTV_SYNTAX, OCI_DEFAULT);
    OCIStmtExecute(w.svc, w.stmt, w.err, 0, 0, nullptr, nullptr, OCI_DEFAULT);
    OraText words[1024] = "";
    sb4 number = 0;
    const auto get = [&] {
        return OCIErrorGet(w.err, 1, nullptr, &number, words, sizeof words, OCI_HTYPE_ERROR);
    };
    const auto armed = [&] {
        const Armed memory;
        return get();
    };
    EXPECT_TRUE(armed() == OCI_SUCCESS || get() == OCI_SUCCESS) << "asked again";
    w.See(number);
    w.See(std::strstr(reinterpret_cast<const char*>(words), "missing") ? "named" : "not named");
}

// An error with words of its own: without memory for them there is a record all the same, and one only.
void ErrorsWithWords(World& w) {
    EXPECT_EQ(OCIFileInit(w.env, w.err), OCI_SUCCESS);
    w.AtEnd([&w] { return OCIFileTerm(w.env, w.err); });
    constexpr char kName[] = "/no/such/folder/and/a/name/that/is/longer/than/a/short/string";
    OCIFileObject* file = nullptr;
    try {
        w.Step("OCIFileOpen", [&] {
            return OCIFileOpen(w.env, w.err, &file, World::Text(kName), nullptr, OCI_FILE_READ_ONLY, OCI_FILE_EXIST,
                               OCI_FILE_BIN);
        }, Told::error_handle, 30152);
    } catch (const Stopped&) {
        EXPECT_EQ(OCIErrorGet(w.err, 2, nullptr, nullptr, nullptr, 0, OCI_HTYPE_ERROR), OCI_NO_DATA);
        if (Seen().failed) throw;
    }
    std::string text;
    w.See(World::Number(w.err, OCI_HTYPE_ERROR, &text));
    w.See(text.find(kName) != std::string::npos ? "named" : text);
}

// Pools lose no session, whatever fails: those that were got are given back at the end, and then none is in use.
void PoolSessions(World& w) {
    auto* pool = w.New<OCISPool>(OCI_HTYPE_SPOOL);
    static std::vector<OCISvcCtx*> held;
    OraText* name = nullptr;
    ub4 length = 0;
    w.AtEnd([&w, pool] {
        for (; !held.empty(); held.pop_back()) OCISessionRelease(held.back(), w.err, nullptr, 0, OCI_DEFAULT);
        ub4 busy = 9;
        EXPECT_EQ(OCIAttrGet(pool, OCI_HTYPE_SPOOL, &busy, nullptr, OCI_ATTR_SPOOL_BUSY_COUNT, w.err), OCI_SUCCESS);
        EXPECT_EQ(busy, 0u);
        const sword code = OCISessionPoolDestroy(pool, w.err, OCI_DEFAULT);
        EXPECT_TRUE(code == OCI_SUCCESS || World::Number(w.err, OCI_HTYPE_ERROR) == 24404);
        return OCI_SUCCESS;
    });
    // Memory for one session but not for the other is a warning.
    w.STEP(OCISessionPoolCreate, w.env, w.err, pool, &name, &length, World::Text(":memory:"), 8, 2, 4, 2, nullptr, 0,
           nullptr, 0, OCI_SPC_HOMOGENEOUS | OCI_SPC_STMTCACHE);
    constexpr char kTag[] = "a tag that is longer than a short string";
    for (const char* tag : {"", kTag, ""}) {
        OCISvcCtx* svc = nullptr;
        w.STEP(OCISessionGet, w.env, w.err, &svc, nullptr, name, length, World::Text(tag), World::Size(tag), nullptr,
               nullptr, nullptr, OCI_SESSGET_SPOOL);
        held.push_back(svc);
    }
    w.STEP(OCISessionRelease, held.back(), w.err, World::Text(kTag), sizeof kTag - 1, OCI_SESSRLS_RETAG);
    held.pop_back();
    w.SURELY(OCISessionRelease, held.back(), w.err, nullptr, 0, OCI_DEFAULT);
    held.pop_back();
    w.See(w.Attribute<ub4>(OCI_ATTR_SPOOL_BUSY_COUNT, pool, OCI_HTYPE_SPOOL));
}

// A branch that is left, taken up, prepared and committed. Whatever fails, what is left of it can be rolled back.
void Branches(World& w) {
    LogOn(w, "", "", w.Folder() + "/branches.db");
    w.stmt = w.New<OCIStmt>(OCI_HTYPE_STMT);
    w.Run("create table if not exists b(n number)");
    w.Run("delete from b");
    w.Run("commit");
    auto* const trans = w.New<OCITrans>(OCI_HTYPE_TRANS);
    XID xid{5, 2, 1, "txb"};
    w.STEP(OCIAttrSet, trans, OCI_HTYPE_TRANS, &xid, sizeof xid, OCI_ATTR_XID, w.err);
    w.STEP(OCIAttrSet, w.svc, OCI_HTYPE_SVCCTX, trans, 0, OCI_ATTR_TRANS, w.err);
    w.AtEnd([&w] {
        const sword code = OCITransRollback(w.svc, w.err, OCI_DEFAULT);
        return World::Number(w.err, OCI_HTYPE_ERROR) == 24756 ? OCI_SUCCESS : code;    // there is none
    });
    w.STEP(OCITransStart, w.svc, w.err, 0, OCI_TRANS_NEW);
    w.Run("insert into b values(1)");
    w.STEP(OCITransDetach, w.svc, w.err, OCI_DEFAULT);
    w.STEP(OCITransStart, w.svc, w.err, 0, OCI_TRANS_RESUME);
    w.Run("insert into b values(2)");
    w.STEP(OCITransPrepare, w.svc, w.err, OCI_DEFAULT);
    w.STEP(OCITransCommit, w.svc, w.err, OCI_TRANS_TWOPHASE);
    w.Run("update b set n = n");
    w.See(w.Attribute<ub4>(OCI_ATTR_ROW_COUNT));
    w.STEP(OCITransRollback, w.svc, w.err, OCI_DEFAULT);
}

constexpr Scenario kScenarios[] = {
    {"Branches", Ground::environment, nullptr, Branches, "2;"},
    {"FromNothing", Ground::nothing, nullptr, FromNothing, "abc;", OCI_DEFAULT, true},
    {"FromNothingThreaded", Ground::nothing, nullptr, FromNothing, "abc;", OCI_THREADED | OCI_OBJECT},
    {"InitializeAndLogOn2", Ground::nothing, nullptr, InitializeAndLogOn2, "20;"},
    {"FreeingTakesNoMemory", Ground::nothing, nullptr, FreeingTakesNoMemory, "freed;", OCI_DEFAULT, true},
    {"HandlesAndDescriptors", Ground::environment, nullptr, HandlesAndDescriptors, "made;"},
    {"AttachAndBegin", Ground::environment, nullptr, AttachAndBegin, "36;version;", OCI_UTF16},
    {"FirstLogon", Ground::environment, nullptr, FirstLogon, "1017;"},
    {"SystemUser", Ground::environment, Account, SystemUser, "in;"},
    {"PasswordChange", Ground::environment, Account, PasswordChange, "changed;"},
    {"LogoffCommits", Ground::environment, nullptr, LogoffCommits, "1;"},
    {"PoolSessions", Ground::environment, nullptr, PoolSessions, "1;"},
    {"ErrorsWithWords", Ground::environment, nullptr, ErrorsWithWords, "30152;named;"},
    {"ErrorTexts", Ground::session, nullptr, ErrorTexts, "942;named;"},
};

}  // namespace

std::span<const Scenario> HandleScenarios() { return kScenarios; }

}  // namespace faults
