// What is the SQLite engine's own: numbers and declared types in a file, descriptions, SQL functions, errors by number,
// the accounts' table, files that cannot be written, databases in memory.
#include <sqlite3.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <functional>
#include <thread>

#include "engine/engine_fixture.h"
#include "engine/sqlite/errors.h"

namespace {

namespace fs = std::filesystem;

class Sqlite : public EngineFixture {};

// A statement that is compiled once goes with its tables, whoever makes them anew: what its values are for is what the
// columns are when it runs.
TEST_F(Sqlite, StatementsFollowTablesMadeAnew) {
    const struct { const char* type; const char* value; int stored; int found; const char* rows; } cases[] = {
        {"varchar2(20)", "05-FEB-24", 0, 0, "05-FEB-24;"}, {"date", "05-FEB-24", 0, 0, "2024-02-05 00:00:00;"},
        {"varchar2(20)", "no date", 0, 0, "no date;"}, {"number(5,1)", "1.5", 0, 0, "1.5;"},
        {"number(5,1)", "99999.9", 1438, 0, ""}, {"date", "05-XXX-24", 1843, 1843, ""},
        {"raw(4)", "0a0b", 0, 0, "\n\v;"}, {"date", "06-FEB-24", 0, 0, "2024-02-06 00:00:00;"}};
    const auto other = Connect();
    for (engine::Connection* maker : {connection_.get(), other.get()}) {
        std::unique_ptr<engine::Query> insert, query;
        for (const auto& c : cases) {
            ASSERT_EQ(Run(*maker, std::string("create table x(a ") + c.type + ")"), 0);
            if (!insert) insert = Prepared("insert into x values(%1)");
            if (!query) query = Prepared("select a || '' from x where a = %1");
            Rows value{{Text(c.value)}};
            EXPECT_EQ(Execute(*insert, value), c.stored) << c.type;
            EXPECT_EQ(Answer(connection_->Commit()), 0);
            EXPECT_EQ(Answer(query->Open(value, {})), c.found) << c.type;
            EXPECT_EQ(c.found == 0 ? Rest(*query) : "", c.rows) << c.type;
            ASSERT_EQ(Run(*maker, "drop table x"), 0);
        }
        Rows value{{Text("x")}};
        EXPECT_EQ(Execute(*insert, value), 942);
        EXPECT_EQ(Answer(query->Open(value, {})), 942);
    }
}

// The row that a change touched is one of its own table's, whatever triggers and cascades did.
TEST_F(Sqlite, RowIdOfAChangeIsOfItsTable) {
    for (const char* sql : {"create table log(a)", "create table t(a integer primary key)",
                            "create table c(a integer references t on delete cascade)",
                            "create trigger i after insert on t begin insert into log values(1); end",
                            "create trigger d before delete on t begin insert into log values(1); end",
                            "insert into log values(1)", "insert into log values(1)", "insert into t values(77)", "insert into c values(77)"})
        ASSERT_EQ(Run(sql), 0) << sql;
    for (const char* sql : {"insert into T values(76)", "update \"t\" set a = 76 where a = 76",
                            "insert into t values(76) on conflict do update set a = 76", "delete from t where a = 76"}) {
        Rows none;
        const auto outcome = Executed(*Prepared(sql), none);
        ASSERT_TRUE(outcome.last_row) << sql;
        EXPECT_EQ(Shown(Row(*outcome.last_row)), "row 0000000000000000004c") << sql;
    }
}

TEST_F(Sqlite, DeferredConstraintUndoesTheTransaction) {
    MustRun("create table p(id integer primary key)",
            "create table late(p integer references p(id) deferrable initially deferred)");
    ASSERT_EQ(Run("insert into late values(77)"), 0);
    EXPECT_EQ(connection_->Commit().Number(), 2091) << "a deferred constraint undoes the transaction";
    EXPECT_FALSE(connection_->InTransaction());
    Rows none;
    EXPECT_EQ(Prepared("select abs(-9223372036854775807 - 1)")->Open(none, {}).Detail(), "integer overflow") << "nothing is lost";
}


TEST_F(Sqlite, FailedCompilationTellsWhoSaysSo) {
    const struct { const char* sql; int number; unsigned offset; } cases[] = {
        {"select 1 frm t", 900, 13}, {"select 1; select 2", 933, 9}, {"select 1; selct 2", 933, 9}};
    for (const auto& c : cases) {
        std::unique_ptr<engine::Query> query;
        std::uint32_t offset = 0;
        const Status status = connection_->Compile({c.sql, Effect::reads, {}}, query, offset);
        EXPECT_EQ(status.Number(), c.number) << c.sql;
        EXPECT_EQ(offset, c.offset) << c.sql;
        EXPECT_STREQ(status.Engine(), "SQLITE");
    }
}

// Texts in UTF-16 come and go as UTF-8, empty ones too.
TEST_F(Sqlite, FilesInUtf16AreReadAsAnyOther) {
    connection_.reset();
    database_.reset();
    sqlite3* file = nullptr;
    const std::string name = folder_ + "/wide.db";
    ASSERT_EQ(sqlite3_open(name.c_str(), &file), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(file, "pragma encoding = 'UTF-16le'; create table t(v varchar2(9), d date, c char(3));"
                                 "insert into t values('ä€', '2024-02-29 00:00:00', 'é'), ('', null, '')",
                           nullptr, nullptr, nullptr), SQLITE_OK);
    sqlite3_close(file);
    ASSERT_TRUE(engine::Open(name, database_).Ok());
    connection_ = Connect();
    EXPECT_EQ(Query("select v, d, c from t"), "ä€,time 2024-02-29 00:00:00,é ;,null,   ;");
}

TEST_F(Sqlite, TextThatIsNoDateStaysAText) {
    ASSERT_EQ(Run("create table t(d date, s timestamp with time zone, i span_ds(1,0))"), 0);
    connection_.reset();
    sqlite3* file = nullptr;
    ASSERT_EQ(sqlite3_open((folder_ + "/test.db").c_str(), &file), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(file, "insert into t values('soon', '12:30:00', 'long'), (5, '2024-02-29 01:02:03.5 +01:00', 1728000500000000)", nullptr,
                           nullptr, nullptr), SQLITE_OK);
    sqlite3_close(file);
    connection_ = Connect();
    EXPECT_EQ(Query("select d, s, i from t"), "soon,12:30:00,long;5,time 2024-02-29 01:02:03.5 +01:00,+000000020 00:00:00.500000000;");
}

TEST_F(Sqlite, BoundMomentsAreWrittenAsTheirColumnsAre) {
    ASSERT_EQ(Run("create table t(d date, s timestamp(3), z timestamp_tz, v varchar2(40))"), 0);
    const date::DateTime zoned{.year = 2024, .month = 2, .day = 29, .hour = 1, .minute = 2, .second = 3, .has_zone = true,
                               .zone_minutes = 90, .nanosecond = 523456789};
    const date::DateTime time{.hour = 12, .minute = 30};
    ASSERT_EQ(Run("insert into t values(?1, ?2, ?3, ?4)", std::vector(4, Moment(zoned))), 0);
    EXPECT_EQ(Query("select d, s, z, v from t"),
              "time 2024-02-29 01:02:03,time 2024-02-29 01:02:03.523,time 2024-02-29 01:02:03.523457 +01:30,"
              "2024-02-29 01:02:03.523456789 +01:30;");
    EXPECT_EQ(Query("select count(*) from t where z = ?1", {Moment(zoned)}), "0;") << "compared as it is";
    EXPECT_EQ(Run("insert into t(v) values(?1)", {Moment(time)}), 0);
    EXPECT_EQ(Query("select v from t where d is null"), "12:30:00;") << "a time alone";
    EXPECT_EQ(Run("insert into t(d) values(?1)", {Moment(time)}), 1843);
    EXPECT_EQ(Run("insert into t(s) values(?1)", {Moment(time)}), 1843);
}

// 48 MB: more than stays in memory.
TEST_F(Sqlite, OpenQueryOutlivesItsTablesInATemporaryFile) {
    ASSERT_EQ(Run("create table t(n integer, v varchar2(2000))"), 0);
    ASSERT_EQ(Run("with recursive r(n) as (select 1 union all select n + 1 from r where n < 40000) "
                  "insert into t select n, hex(zeroblob(600)) from r"), 0);
    struct : engine::RowSink {
        std::int64_t row = 0;
        Status Row(std::uint32_t, std::span<const Datum> values) override {
            const bool is_right = values[0].integer == ++row && values[1].length == 1200 &&
                                  values[1].Text().find_first_not_of('0') == std::string_view::npos;
            return is_right ? Status() : Error(600);
        }
    } sink;
    const auto open = Opened("select n, v from t order by n");
    bool more = false;
    MUST(Answer(open->Fetch(sink, 1, more)), Run("drop table t"));
    ASSERT_EQ(Answer(open->Fetch(sink, 100000, more)), 0) << "row " << sink.row;
    EXPECT_EQ(sink.row, 40000);
    EXPECT_FALSE(more);
}

TEST_F(Sqlite, AccountsAreNobodysBusiness) {
    EXPECT_EQ(Answer(connection_->ChangePassword("ann", "secret", "other")), 1017) << "no accounts";
    EXPECT_EQ(Run("create table KELP_accounts(name, password)"), 1031) << "nobody but the engine makes it";
    EXPECT_EQ(Run("create temp view kelp_accounts as select 'ANN' as name, '' as password"), 1031);
    MUST(LogOn("ann", "secret"), Run("create table t(n integer)"));
    EXPECT_EQ(Query("select name from kelp_accounts"), "ANN;");
    for (const char* sql :
         {"update kelp_accounts set password = ''", "delete from kelp_accounts", "delete from Main.KELP_Accounts",
          "insert into kelp_accounts values('BOB', '', '')", "drop table kelp_accounts",
          "alter table kelp_accounts rename to x", "alter table kelp_accounts add y", "create index i on kelp_accounts(name)", "delete from sqlite_master",
          "create trigger g after insert on kelp_accounts begin select 1; end", "select password from kelp_accounts",
          "select * from kelp_accounts", "select count(*) from kelp_accounts where password like '$y$%'",
          "insert into t select n from t returning (select max(password) from kelp_accounts)"}) {
        EXPECT_EQ(Run(sql), 1031) << sql;
    }
    ASSERT_EQ(Run("create trigger g after insert on t begin delete from kelp_accounts; end"), 0);
    EXPECT_EQ(Run("insert into t values(1)"), 1031) << "through a trigger";
    ASSERT_EQ(Run("create view w as select * from kelp_accounts"), 0);
    EXPECT_EQ(Run("select * from w"), 1031) << "through a view";
    EXPECT_EQ(Run("attach '" + folder_ + "/test.db' as again"), 0);
    EXPECT_EQ(Run("delete from again.kelp_accounts"), 1031);
    EXPECT_EQ(Run("pragma writable_schema = on"), 0);
    EXPECT_NE(Run("delete from sqlite_schema"), 0) << "the schema is no table";
    engine::ObjectDescription object;
    EXPECT_EQ(Answer(connection_->Describe("kelp_accounts", engine::ObjectKind::table, object)), 0);

    MUST(Answer(connection_->Rollback()), LogOn("ann", "secret"));
    sqlite3* file = nullptr;
    std::string hash;
    ASSERT_EQ(sqlite3_open((folder_ + "/test.db").c_str(), &file), SQLITE_OK);
    const auto take = [](void* text, int, char** values, char**) { *static_cast<std::string*>(text) = values[0]; return 0; };
    sqlite3_exec(file, "select password from kelp_accounts", take, &hash, nullptr);
    sqlite3_close(file);
    EXPECT_EQ(hash.substr(0, 3), "$y$");
}

// The tables of a database in memory stay for the next session, what was the former one's alone does not.
TEST_F(Sqlite, SessionsOfADatabaseInMemoryShareItsTablesAlone) {
    connection_.reset();
    ASSERT_TRUE(engine::Open(":memory:", database_).Ok());
    connection_ = Connect();
    MustRun("create table kept(n integer primary key, p integer references kept(n))",
            "create temp table mine(n integer)", "create temp view seen as select * from kept",
            "create temp trigger g after insert on kept begin delete from kept; end",
            "attach '" + folder_ + "/test.db' as other");
    EXPECT_EQ(Query("pragma query_only = 1"), "");
    EXPECT_EQ(Query("pragma foreign_keys = 0"), "");
    connection_.reset();
    connection_ = Connect();
    EXPECT_EQ(Run("insert into kept values(1, 2)"), 2291) << "references are checked again";
    EXPECT_EQ(Run("insert into kept values(1, 1)"), 0);
    EXPECT_EQ(Query("select n from kept"), "1;") << "no trigger of the former session's";
    EXPECT_EQ(Query("select * from mine"), "error 942");
    EXPECT_EQ(Query("select * from seen"), "error 942");
    EXPECT_EQ(Query("select name from pragma_database_list where name <> 'temp'"), "main;");
    connection_.reset();
    connection_ = Connect();
    EXPECT_EQ(Query("select * from kept"), "") << "rolled back at the end";
}

TEST_F(Sqlite, SchemasAndTheDatabaseAreDescribed) {
    MustRun("create table t(n integer)", "create temp table t(v varchar2(3))");
    engine::ObjectDescription object;
    ASSERT_EQ(Answer(connection_->Describe("t", engine::ObjectKind::any, object)), 0);
    EXPECT_EQ(object.schema, "TEMP") << "as SQLite looks for a name";
    EXPECT_TRUE(object.temporary);
    ASSERT_EQ(Answer(connection_->Describe("main.t", engine::ObjectKind::any, object)), 0);
    EXPECT_EQ(object.columns[0].name, "N");
    EXPECT_FALSE(object.temporary);
    MustRun("create table \"o`d\"(n integer)", "create table main.w(n integer primary key) without rowid");
    EXPECT_FALSE(object.index_only);
    EXPECT_EQ(Answer(connection_->Describe("W", engine::ObjectKind::any, object)), 0);
    EXPECT_TRUE(object.index_only);
    EXPECT_EQ(Answer(connection_->Describe("\"o`d\"", engine::ObjectKind::table, object)), 0);
    ASSERT_EQ(Answer(connection_->Describe("TEST", engine::ObjectKind::database, object)), 0);
    EXPECT_EQ(object.members, (std::vector<std::string>{"TEMP", "MAIN"}));
}

TEST_F(Sqlite, BrokenDatabasesHaveTheirNumbers) {
    MustCommit("create table t(n integer, v text)", "insert into t values(1, 'kept')");
    std::unique_ptr<engine::Database> none;
    EXPECT_EQ(Answer(engine::Open(folder_ + "/no/such/folder/x.db", none)), 12154);
    EXPECT_EQ(Answer(engine::Open("postgresql:///x?host=/no/such", none)), 12541);
    EXPECT_EQ(Answer(engine::Open(folder_ + "/", none)), 12154);
    std::ofstream(folder_ + "/text.db") << std::string(5000, 'x');
    EXPECT_EQ(Answer(engine::Open(folder_ + "/text.db", none)), 1210);
    EXPECT_FALSE(none);

    EXPECT_EQ(Query("pragma max_page_count = 10"), "10;");
    EXPECT_EQ(Run("insert into t values(2, zeroblob(100000))"), 1653) << "full";
    EXPECT_EQ(Query("select n, v from t"), "1,kept;");

    rlimit limit{};
    getrlimit(RLIMIT_FSIZE, &limit);
    const auto may_grow_to = [&](rlim_t size) { setrlimit(RLIMIT_FSIZE, (limit.rlim_cur = size, &limit)); };
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    EXPECT_EQ(Query("pragma max_page_count = 10000"), "10000;");
    ASSERT_EQ(Run("insert into t values(2, zeroblob(100000))"), 0);
    may_grow_to(50000);
    EXPECT_EQ(Answer(connection_->Commit()), 1653) << "the limit of the process";
    may_grow_to(limit.rlim_max);
    std::signal(SIGXFSZ, handler);
    EXPECT_EQ(Query("select n, v from t"), "1,kept;");

    EXPECT_EQ(Query("pragma query_only = 1"), "");
    EXPECT_EQ(Run("insert into t values(3, 'x')"), 16000) << "read-only";
}

// Runs an action in a process of a user who may write nothing here; answers what it counted.
int AsNobody(const std::function<int()>& action) {
    const pid_t child = fork();
    if (child == 0) {
        constexpr uid_t kNobody = 65534;
        if (geteuid() == 0 && (setgid(kNobody) != 0 || setuid(kNobody) != 0)) _exit(99);
        _exit(action());
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST_F(Sqlite, FileThatCannotBeWrittenIsRead) {
    MustCommit("create table t(n integer)", "insert into t values(1)");
    connection_.reset();
    database_.reset();
    const std::string file = folder_ + "/a %25?\xC3\xA4.db";
    fs::rename(folder_ + "/test.db", file);
    ASSERT_FALSE(fs::exists(file + "-wal"));
    const auto look = [&] {
        std::unique_ptr<engine::Database> database;
        if (engine::Open(file, database_).Failed()) return 1;
        std::unique_ptr<engine::Connection> connection;
        if (database_->Connect({"", "", true}, stop_, connection_).Failed()) return 2;
        if (Query("select n from t") != "1;") return 3;
        if (Run("insert into t values(2)") != 16000) return 4;
        if (Run("create table u(n integer)") != 16000) return 5;
        if (Query("select n from t") != "1;") return 6;
        return 0;
    };
    MUST(chmod(file.c_str(), 0444), chmod(folder_.c_str(), 0555));
    EXPECT_EQ(AsNobody(look), 0) << "neither the file nor its folder";
    ASSERT_EQ(chmod(folder_.c_str(), 0777), 0);
    EXPECT_EQ(AsNobody(look), 0) << "the file";
    ASSERT_EQ(chmod(file.c_str(), 0666), 0);
    for (const char* end : {"-wal", "-shm"}) fs::remove(file + end);
    ASSERT_EQ(chmod(folder_.c_str(), 0555), 0);
    EXPECT_EQ(AsNobody(look), 0) << "the folder";
    std::ofstream(file + "-wal") << "what a writer has left";
    EXPECT_EQ(AsNobody(look), geteuid() == 0 ? 1 : 0) << "what lies in the log cannot be seen";
}

TEST_F(Sqlite, OnlyWhoOwnsTheFileNeedsNoPassword) {
    ASSERT_EQ(LogOn("ann", "secret"), 0);
    connection_ = Connect();
    connection_.reset();
    database_.reset();
    const std::string file = folder_ + "/test.db";
    ASSERT_EQ(chmod(folder_.c_str(), 0555), 0);
    const auto look = [&] {
        if (engine::Open(file, database_).Failed()) return 1;
        return Answer(database_->Connect({"", "", true}, stop_, connection_)) == 1017 ? 0 : 2;
    };
    EXPECT_EQ(geteuid() == 0 ? AsNobody(look) : 0, 0) << "needs another user, as root may become";
}

TEST_F(Sqlite, ALostTransactionIsToldOnce) {
    const Status once = engine::sqlite::RolledBack(Error(1653, "full"));
    EXPECT_EQ(once.Detail(), "full; the transaction was rolled back");
    EXPECT_EQ(engine::sqlite::RolledBack(once).Detail(), once.Detail());
}

// Pages that lie in an unwritable file may be of two times once somebody else has written it: no answer then.
TEST_F(Sqlite, FileThatIsWrittenAllTheSameIsReadNoMore) {
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    connection_.reset();
    database_.reset();
    const std::string file = folder_ + "/test.db";
    ASSERT_EQ(chmod(folder_.c_str(), 0555), 0);
    int ready[2], written[2];
    ASSERT_TRUE(pipe(ready) == 0 && pipe(written) == 0);
    std::thread writer([&] {
        char byte = 0;
        (void)!read(ready[0], &byte, 1);
        sqlite3* database = nullptr;
        sqlite3_open(file.c_str(), &database);
        sqlite3_exec(database, "insert into t values(1)", nullptr, nullptr, nullptr);
        (void)!write(written[1], &byte, 1);
        sqlite3_close(database);
    });
    const auto look = [&] {
        char byte = 'x';
        const bool opened = engine::Open(file, database_).Ok();
        if (opened) connection_ = Connect();
        const bool empty = opened && Query("select n from t").empty();
        (void)!write(ready[1], &byte, 1);
        (void)!read(written[0], &byte, 1);
        if (!opened || !empty) return 1;
        if (Query("select n from t") != "error 3113" || !connection_->Broken()) return 2;
        connection_.reset();
        return 0;
    };
    EXPECT_EQ(geteuid() == 0 ? AsNobody(look) : 0, 0) << "needs a writer who may, as root may";
    if (geteuid() != 0) (void)!write(ready[1], "x", 1);
    writer.join();
    for (const int end : {ready[0], ready[1], written[0], written[1]}) close(end);
}

}  // namespace
