// Environments, handles and descriptors, logons, accounts, error records.
#include <cstring>
#include <filesystem>
#include <thread>
#include <vector>

#include "faults/world.h"

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
    w.STEP_TOLD(Told::code, OCIEnvCreate, &w.env, w.mode, nullptr, ApplicationMemory::Allocate, nullptr,
                ApplicationMemory::Release, 16, nullptr);
    OwnEnvironment(w);
}

void LogOffAtEnd(World& w) {
    w.AtEnd([&w, svc = w.svc] { return w.svc = nullptr, OCILogoff(svc, w.err); });
}

// On a context that is there: after a failure it serves the next logon.
void LogOn(World& w, std::string_view user, std::string_view password, std::string_view database) {
    w.svc = w.New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    const auto log_on = [&] {
        return OCILogon(w.env, w.err, &w.svc, user.empty() ? nullptr : World::Text(user), World::Size(user),
                        user.empty() ? nullptr : World::Text(password), World::Size(password), World::Text(database),
                        World::Size(database));
    };
    Attempt([&] { w.Step("OCILogon", log_on); },
            [&] { EXPECT_EQ(log_on() + OCILogoff(std::exchange(w.svc, nullptr), w.err), OCI_SUCCESS); });
    LogOffAtEnd(w);
}

// A statement from nothing to its first row.
SCENARIO(FromNothing, nothing, nullptr, "abc;", OCI_THREADED | OCI_OBJECT, true) {
    CreateEnvironment(w);
    LogOn(w, "", "", ":memory:");
    w.stmt = w.New<OCIStmt>(OCI_HTYPE_STMT);
    w.Prepare("select 'abc' from dual");
    char text[4] = "";
    w.Define(1, {text, 4, SQLT_STR});
    w.Execute(1);
    w.See(text);
}

SCENARIO(LogonBeside, session, nullptr, "") {
    OCISvcCtx*& other = w.Kept<OCISvcCtx*>();
    const std::string database = w.Database();
    w.STEP(OCILogon, w.env, w.err, &other, nullptr, 0, nullptr, 0, World::Text(database), World::Size(database));
    w.AtEnd([&] { return OCILogoff(other, w.err); });
}

// The older way in, and a logon that brings the statement cache along.
SCENARIO(InitializeAndLogOn2, nothing, nullptr, "20;") {
    w.STEP_TOLD(Told::code, OCIInitialize, w.mode, nullptr, ApplicationMemory::Allocate, nullptr,
                ApplicationMemory::Release);
    w.AtEnd([] { return OCITerminate(OCI_DEFAULT); });
    w.STEP_TOLD(Told::code, OCIEnvInit, &w.env, OCI_DEFAULT, 16, nullptr);
    OwnEnvironment(w);
    w.STEP(OCILogon2, w.env, w.err, &w.svc, nullptr, 0, nullptr, 0, World::Text(":memory:"), 8, OCI_LOGON2_STMTCACHE);
    LogOffAtEnd(w);
    w.STEP(OCIBreak, w.svc, w.err);
    w.STEP(OCIReset, w.svc, w.err);
    w.See(w.Attribute<ub4>(OCI_ATTR_STMTCACHESIZE, w.svc, OCI_HTYPE_SVCCTX));
}

// Frees what another thread made undisturbed: an end takes no memory, even as a thread's first call.
SCENARIO(FreeingTakesNoMemory, nothing, nullptr, "freed;", OCI_DEFAULT, true) {
    std::unique_ptr<World> other;
    dvoid* descriptor = nullptr;
    std::thread([&] {
        other = std::make_unique<World>(session, OCI_DEFAULT);
        other->Begin();
        OCIDescriptorAlloc(other->env, &descriptor, OCI_DTYPE_TIMESTAMP, 0, nullptr);
        OCIStmtPrepare(other->stmt, other->err, World::Text("select 1 from dual"), 18, OCI_NTV_SYNTAX, OCI_DEFAULT);
        EXPECT_EQ(OCIStmtExecute(other->svc, other->stmt, other->err, 0, 0, nullptr, nullptr, OCI_DEFAULT),
                  OCI_SUCCESS);
    }).join();
    w.SURELY(OCIDescriptorFree, descriptor, OCI_DTYPE_TIMESTAMP);
    w.SURELY(OCIHandleFree, other->stmt, OCI_HTYPE_STMT);
    w.SURELY(OCILogoff, std::exchange(other->svc, nullptr), other->err);
    w.SURELY(OCIHandleFree, std::exchange(other->env, nullptr), OCI_HTYPE_ENV);
    w.See("freed");
}

SCENARIO(HandlesAndDescriptors, environment, nullptr, "made;") {
    for (ub4 type = OCI_HTYPE_ERROR; type <= 29; ++type)
        if (type != OCI_HTYPE_BIND && type != OCI_HTYPE_DEFINE) w.New<dvoid>(type);
    for (const ub4 type : {OCI_DTYPE_LOB, OCI_DTYPE_ROWID, OCI_DTYPE_RSET, OCI_DTYPE_TIMESTAMP_TZ})
        w.NewDescriptor<dvoid>(type);
    static dvoid* array[5];
    w.STEP_TOLD(Told::environment, OCIArrayDescriptorAlloc, w.env, array, OCI_DTYPE_DATE, 5, 8, nullptr);
    w.AtEnd([] { return OCIArrayDescriptorFree(array, OCI_DTYPE_DATE); });
    w.See("made");
}

// A server, a session and a context put together by hand, in UTF-16.
SCENARIO(AttachAndBegin, environment, nullptr, "36;version;", OCI_UTF16) {
    auto* server = w.New<OCIServer>(OCI_HTYPE_SERVER);
    auto* session = w.New<OCISession>(OCI_HTYPE_SESSION);
    auto* svc = w.New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    w.STEP(OCIServerAttach, server, w.err, reinterpret_cast<const OraText*>(u":memory:"), 16, OCI_DEFAULT);
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

// The first logon by name makes the database and its owner's account: both, or neither. Then the password is another.
SCENARIO(FirstLogon, environment, nullptr, "1017;") {
    const std::string database = w.Folder() + "/new.db";
    w.AtEnd([database] { return std::filesystem::remove(database), OCI_SUCCESS; });
    LogOn(w, "ann", "one", database);
    const auto change = [&w](const char* from, const char* to) {
        return OCIPasswordChange(w.svc, w.err, World::Text("ann"), 3, World::Text(from), 3, World::Text(to), 3,
                                 OCI_DEFAULT);
    };
    Attempt([&] { w.Step("OCIPasswordChange", [&] { return change("one", "two"); }); },
            [&] { EXPECT_EQ(change("one", "one"), OCI_SUCCESS) << "it is still the old one"; });
    LogOn(w, "ann", "two", database);
    OCISvcCtx* other = nullptr;
    EXPECT_EQ(OCILogon(w.env, w.err, &other, World::Text("ann"), 3, World::Text("one"), 3, World::Text(database),
                       World::Size(database)), OCI_ERROR);
    w.See(w.Number(w.err, OCI_HTYPE_ERROR));
}

// The end of a session commits what is open, queries or not.
SCENARIO(LogoffCommits, session, nullptr, "1;") {
    const std::string database = w.Folder() + "/logoff.db";
    const Instead of_the_worlds(w.svc, {});
    const auto log_on = [&] {
        EXPECT_EQ(OCILogon(w.env, w.err, &w.svc, nullptr, 0, nullptr, 0, World::Text(database), World::Size(database)),
                  OCI_SUCCESS);
    };
    const auto rows_kept = [&] {
        log_on();
        const std::string rows = w.One("select count(*) from t");
        EXPECT_EQ(OCILogoff(w.svc, w.err), OCI_SUCCESS);
        EXPECT_EQ(rows, "1") << (Seen().failed ? "after a logoff that failed" : "after a logoff");
        return rows;
    };
    log_on();
    w.Sql("create table if not exists t(a number)");
    w.Sql("delete from t");
    w.Sql("commit");
    w.Sql("insert into t values(1)");
    OCIStmtPrepare(w.stmt, w.err, World::Text("select a from t"), 15, OCI_NTV_SYNTAX, OCI_DEFAULT);
    EXPECT_EQ(OCIStmtExecute(w.svc, w.stmt, w.err, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS);
    Attempt([&] { w.STEP(OCILogoff, w.svc, w.err); }, [&] {
        EXPECT_EQ(OCILogoff(w.svc, w.err), OCI_SUCCESS) << "again";
        rows_kept();
    });
    w.See(rows_kept());
}

// What is told of an error takes memory, too; without it there is the return code, and the record stays.
SCENARIO(ErrorTexts, session, nullptr, "942;named;") {
    OCIStmtPrepare(w.stmt, w.err, World::Text("select * from missing"), 21, OCI_NTV_SYNTAX, OCI_DEFAULT);
    OCIStmtExecute(w.svc, w.stmt, w.err, 0, 0, nullptr, nullptr, OCI_DEFAULT);
    OraText words[1024] = "";
    sb4 number = 0;
    const auto get = [&] { return OCIErrorGet(w.err, 1, nullptr, &number, words, sizeof words, OCI_HTYPE_ERROR); };
    const auto armed = [&] {
        const Armed memory;
        return get();
    };
    EXPECT_TRUE(armed() == OCI_SUCCESS || get() == OCI_SUCCESS) << "asked again";
    w.See(number);
    w.See(std::strstr(reinterpret_cast<const char*>(words), "missing") ? "named" : "not named");
}

// An error with words of its own: without memory for them there is a record all the same, and one only.
SCENARIO(ErrorsWithWords, environment, nullptr, "30152;named;") {
    EXPECT_EQ(OCIFileInit(w.env, w.err), OCI_SUCCESS);
    w.AtEnd([&w] { return OCIFileTerm(w.env, w.err); });
    constexpr char kName[] = "/no/such/folder/and/a/name/that/is/longer/than/a/short/string";
    OCIFileObject* file = nullptr;
    try {
        w.STEP_OR(30152, OCIFileOpen, w.env, w.err, &file, World::Text(kName), nullptr, OCI_FILE_READ_ONLY,
                  OCI_FILE_EXIST, OCI_FILE_BIN);
    } catch (const Stopped&) {
        EXPECT_EQ(OCIErrorGet(w.err, 2, nullptr, nullptr, nullptr, 0, OCI_HTYPE_ERROR), OCI_NO_DATA);
        if (Seen().failed) throw;
    }
    std::string text;
    w.See(World::Number(w.err, OCI_HTYPE_ERROR, &text));
    w.See(text.find(kName) != std::string::npos ? "named" : text);
}

// Pools lose no session, whatever fails: those that were got are given back at the end, and then none is in use.
SCENARIO(PoolSessions, environment, nullptr, "1;") {
    auto* pool = w.New<OCISPool>(OCI_HTYPE_SPOOL);
    auto& held = w.Kept<std::vector<OCISvcCtx*>>();
    OraText* name = nullptr;
    ub4 length = 0;
    w.AtEnd([&w, &held, pool] {
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
SCENARIO(Branches, environment, nullptr, "2;") {
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

}  // namespace
}  // namespace faults
