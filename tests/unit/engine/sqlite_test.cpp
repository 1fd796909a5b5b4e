// What is the SQLite engine's own: numbers and declared types in a file, descriptions, SQL functions, errors by number,
// the accounts' table, files that cannot be written.
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

class Sqlite : public EngineFixture {
protected:
    // Runs statements on a file as another program does; answers what the last row begins with.
    std::string ByHand(const char* sql, const char* name = "/test.db") const {
        sqlite3* file = nullptr;
        std::string found;
        const auto take = [](void* text, int, char** values, char**) { *static_cast<std::string*>(text) = values[0]; return 0; };
        EXPECT_EQ(sqlite3_open((folder_ + name).c_str(), &file), SQLITE_OK);
        EXPECT_EQ(sqlite3_exec(file, sql, take, &found, nullptr), SQLITE_OK) << sql;
        sqlite3_close(file);
        return found;
    }
};

// Texts in UTF-16 come and go as UTF-8, empty ones too; what is no date stays a text.
TEST_F(Sqlite, WhatOtherProgramsWroteIsRead) {
    ByHand("pragma encoding = 'UTF-16le'; create table t(v varchar2(9), d date, c char(3), s timestamp with time zone, i span_ds(1,0), l clob);"
           "insert into t values('ä€', '2024-02-29 00:00:00', 'é', '12:30:00', 'long', 'ö€'), ('', null, '', null, null, ''),"
           "('x', 'soon', 'x', '2024-02-29 01:02:03.5 +01:00', 1728000500000000, null), (null, 5, null, null, null, 5)", "/wide.db");
    connection_.reset();
    ASSERT_TRUE(engine::Open(folder_ + "/wide.db", database_).Ok());
    connection_ = Connect();
    EXPECT_EQ(Query("select v, d, c, s, i, l from t"),
              "ä€,time 2024-02-29 00:00:00,é ,12:30:00,long,ö€;,null,   ,null,null,;"
              "x,soon,x  ,time 2024-02-29 01:02:03.5 +01:00,+000000020 00:00:00.500000000,null;null,5,null,null,null,5;");
    EXPECT_EQ(Run("insert into t(d) values(?1)", {Moment({.hour = 12})}), 1843) << "a time alone, which is a text";
    EXPECT_EQ(Query("select ?1 || v from t where c = 'x'", {Moment({.hour = 12})}), "12:00:00x;");
}

// Transcripts show what else is refused of their table.
TEST_F(Sqlite, AccountsAreNobodysBusiness) {
    EXPECT_EQ(Answer(connection_->ChangePassword("ann", "secret", "other")), 1017) << "no accounts";
    EXPECT_EQ(Run("create temp view kelp_accounts as select 'ANN' as name, '' as password"), 1031);
    MUST(LogOn("ann", "secret"), Run("create table t(n integer)"),
         Run("create trigger g after insert on t begin delete from kelp_accounts; end"), Run("create view w as select * from kelp_accounts"),
         Run("attach '" + folder_ + "/test.db' as again"));
    EXPECT_EQ(Query("select name from kelp_accounts"), "ANN;");
    for (const char* sql :
         {"delete from Main.KELP_Accounts", "alter table kelp_accounts rename to x", "create index i on kelp_accounts(name)",
          "create trigger h after insert on kelp_accounts begin select 1; end", "select password from kelp_accounts",
          "select count(*) from kelp_accounts where password like '$y$%'", "insert into t values(1)", "select * from w",
          "insert into t select n from t returning (select max(password) from kelp_accounts)", "delete from again.kelp_accounts"})
        EXPECT_EQ(Run(sql), 1031) << sql;
    EXPECT_EQ(Run("pragma writable_schema = on"), 0);
    EXPECT_NE(Run("delete from sqlite_schema"), 0) << "the schema is no table";
    MUST(Answer(connection_->Rollback()), LogOn("ann", "secret"));
    EXPECT_TRUE(ByHand("select password from kelp_accounts").starts_with("$y$"));
}

TEST_F(Sqlite, BrokenDatabasesHaveTheirNumbers) {
    MustCommit("create table t(n integer, v text)", "insert into t values(1, 'kept')");
    std::unique_ptr<engine::Database> none;
    std::ofstream(folder_ + "/text.db") << std::string(5000, 'x');
    for (const auto& [name, number] : {std::pair{"/no/such/folder/x.db", 12154}, {"/", 12154}, {"/text.db", 1210}})
        EXPECT_EQ(Answer(engine::Open(folder_ + name, none)), number) << name;
    EXPECT_FALSE(none);

    rlimit limit{};
    getrlimit(RLIMIT_FSIZE, &limit);
    const auto may_grow_to = [&](rlim_t size) { setrlimit(RLIMIT_FSIZE, (limit.rlim_cur = size, &limit)); };
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    ASSERT_EQ(Run("insert into t values(2, zeroblob(100000))"), 0);
    may_grow_to(50000);
    EXPECT_EQ(Answer(connection_->Commit()), 1653) << "the limit of the process";
    may_grow_to(limit.rlim_max);
    std::signal(SIGXFSZ, handler);
    EXPECT_EQ(Query("select n, v from t"), "1,kept;");
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
        if (engine::Open(file, database_).Failed() || !database_->Version().ends_with("\nDatabase " + file)) return 1;
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

// Pages that lie in an unwritable file may be of two times once somebody else has a log beside it, or has written it: no
// answer then, and none when the log is gone again.
TEST_F(Sqlite, FileThatIsWrittenAllTheSameIsReadNoMore) {
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    connection_.reset();
    database_.reset();
    const std::string file = folder_ + "/test.db", log = file + "-wal";
    ASSERT_EQ(chmod(folder_.c_str(), 0555), 0);
    int asked[2], done[2];
    ASSERT_TRUE(pipe(asked) == 0 && pipe(done) == 0);
    std::thread writer([&] {
        char what = 0;
        while (read(asked[0], &what, 1) == 1 && what != 'x') {
            if (what == 'l') std::ofstream(log) << "what a writer brings";
            else if (what == 'r') fs::remove(log);
            else fs::last_write_time(file, fs::file_time_type::clock::now());
            (void)!write(done[1], &what, 1);
        }
    });
    const auto look = [&] {
        if (engine::Open(file, database_).Failed()) return 1;
        for (const std::string_view changes : {"lr", "w"}) {
            connection_ = Connect();
            if (!Query("select n from t").empty()) return 2;
            for (char what : changes) {
                if (write(asked[1], &what, 1) + read(done[0], &what, 1) != 2) return 3;
                if (Query("select n from t") != "error 3113" || !connection_->Broken()) return 4;
            }
        }
        connection_.reset();
        return 0;
    };
    EXPECT_EQ(geteuid() == 0 ? AsNobody(look) : 0, 0) << "needs a writer who may, as root may";
    (void)!write(asked[1], "x", 1);
    writer.join();
    for (const int end : {asked[0], asked[1], done[0], done[1]}) close(end);
}

}  // namespace
