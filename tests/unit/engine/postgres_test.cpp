// What the PostgreSQL engine does in its own way: servers that cannot be reached or go away, cursors, notices,
// what the server says as published numbers.
#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>

#include <chrono>
#include <csignal>
#include <thread>

#include "engine/postgres/errors.h"
#include "engine/engine_fixture.h"
#include "number/digits.h"
#include "support/postgres_database.h"

namespace {

using engine::TransactionMode;

// Interrupt waits of this thread all the time.
struct Signals {
    struct sigaction before;
    Signals() {
        struct sigaction nothing{};
        nothing.sa_handler = [](int) {};
        sigaction(SIGALRM, &nothing, &before);
        Every({0, 20000});
    }
    ~Signals() {
        Every({});
        sigaction(SIGALRM, &before, nullptr);
    }
    static void Every(timeval time) {
        const itimerval timer{time, time};
        setitimer(ITIMER_REAL, &timer, nullptr);
    }
};

class Postgres : public EngineFixture {
protected:
    std::string FreshName() override {
        server_ = std::make_unique<PostgresDatabase>();
        return server_->Url();
    }
    void TearDown() override {
        EngineFixture::TearDown();
        server_.reset();
    }
    // Ends the server's side of the session.
    void Kill() {
        const std::string process = Query("select pg_backend_pid()");
        server_->Run("select pg_terminate_backend(" + process.substr(0, process.size() - 1) + ", 5000)");
    }
    std::unique_ptr<PostgresDatabase> server_;
};

TEST_F(Postgres, ServerThatCannotBeReached) {
    std::unique_ptr<engine::Database> none;
    const struct { std::string url; int number; } cases[] = {
        {"postgresql:///x?host=/no/such", 12541},
        {"postgresql://kelp@127.0.0.1:1/x", 12541},
        {"postgresql://no.such.host.invalid/x", 12154},
        {"postgresql://x:y:z/", 12560},
        {server_->Url().replace(server_->Url().find("/t"), 2, "/nowhere"), 12514}};
    EXPECT_EQ(LogOn("\"\"", "x"), 1017) << "no name is nobody's";
    EXPECT_EQ(LogOn("\"" + server_->Owner() + "\"", "secret"), 0);
    for (const auto& c : cases) EXPECT_EQ(Answer(engine::Open(c.url, none)), c.number) << c.url;

    std::unique_ptr<engine::Connection> patient;
    MUST(Answer(engine::Open(server_->Url() + "&options=-c%20lock_timeout%3D77", none)), Answer(none->Connect({"", "", true}, stop_, patient)));
    EXPECT_EQ(Query(*patient, "select current_setting('lock_timeout') where '" + none->Version() +
                                  "' = current_setting('server_version') || ' KELP server engine, ' || version()"), "77ms;");
    patient.reset();

    // Somebody listens and says nothing.
    const int listener = socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un place{.sun_family = AF_UNIX, .sun_path = {}};
    std::snprintf(place.sun_path, sizeof place.sun_path, "%s/.s.PGSQL.5432", folder_.c_str());
    ASSERT_EQ(bind(listener, reinterpret_cast<const sockaddr*>(&place), sizeof place) + listen(listener, 1), 0);
    const auto start = std::chrono::steady_clock::now();
    auto signals = std::make_unique<Signals>();
    EXPECT_EQ(Answer(engine::Open("postgresql:///x?connect_timeout=1&host=" + folder_, none)), 12170);
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
    signals.reset();

    // Somebody listens and says something else, or that there is no logging on.
    const auto refusal = [](const char* state) {
        const std::string said = std::string("SFATAL\0VFATAL\0C", 15) + state + std::string("\0Mno\0", 6);
        return std::string("E\0\0", 3) + '\0' + static_cast<char>(said.size() + 4) + said;
    };
    const std::pair<std::string, int> answers[] = {{"", 12547}, {"HTTP/1.1 400", 12560}, {refusal("57P03"), 1033},
                                                   {refusal("53300"), 18}, {refusal("28P01"), 0}, {refusal("ZZ000"), 600}};
    close(accept(listener, nullptr, nullptr));    // who has given up
    for (const auto& [said, number] : answers) {
        std::thread server([&, &words = said] {
            const int peer = accept(listener, nullptr, nullptr);
            char asked[1000];
            EXPECT_GT(recv(peer, asked, sizeof asked, 0), 0);
            EXPECT_EQ(send(peer, words.data(), words.size(), MSG_NOSIGNAL), static_cast<ssize_t>(words.size()));
            close(peer);
        });
        const Status status = engine::Open("postgresql:///x?host=" + folder_, none);
        EXPECT_EQ(Answer(status), number) << said;
        if (number == 18) { EXPECT_EQ(status.Detail(), "no"); }
        server.join();
    }
    close(listener);
}

// At each call: 3113 first, 3114 then, whatever was open; and a new logon works.
TEST_F(Postgres, ServerThatGoesAway) {
    MustCommit("create table t(n integer)", "insert into t select generate_series(1, 3000)");
    engine::ArrayOutcome outcome;
    Rows many;
    many.rows.assign(20, {Integer(1)});
    Written rows;
    bool flag = false;
    std::unique_ptr<engine::Query> query, insert;
    const std::pair<const char*, std::function<Status()>> calls[] = {
        {"array", [&] { return insert->ExecuteArray(many, {.first = 0, .last = 20}, outcome); }},
        {"begin", [&] { return connection_->Begin(TransactionMode::serializable); }},
        {"keeps", [&] { return connection_->KeepsPrepared({.format = 1}, flag); }},
        {"mark", [&] { return connection_->SetMark(); }},
        {"commit", [&] { return connection_->Commit(); }},
        {"prepare", [&] { return connection_->Prepare({.format = 1}, flag); }}};
    for (const auto& [name, call] : calls) {
        insert = Prepared("insert into t values(%1)", std::vector{Integer(1)});
        MUST(Execute(*insert, many, {.first = 0, .last = 20}), Answer(connection_->Rollback()),
             Answer(connection_->KeepsPrepared({.format = 1}, flag)));
        query = Opened("select n from t");
        if (name[0] == 'c' || name[0] == 'p') { ASSERT_EQ(Run("delete from t where n = 1"), 0); }
        Kill();
        const Status status = call();
        EXPECT_EQ(Answer(status), 3113) << name;
        EXPECT_TRUE(status.Detail().starts_with("terminating connection due to administrator command")) << status.Detail();
        EXPECT_EQ(Answer(call()), 3114) << name;
        EXPECT_EQ(Answer(connection_->Rollback()), 3114) << name;
        query->Close();
        EXPECT_EQ(Fetched(*query, 1), "error 3114") << name;
        EXPECT_FALSE(connection_->HasNotices()) << "its last words are the error's: " << name;
        EXPECT_TRUE(connection_->Broken() && !connection_->InTransaction()) << name;
        query.reset();
        insert.reset();
        connection_ = Connect();
        EXPECT_EQ(Query("select count(*) from t"), "3000;") << name;
    }
    // In the middle, behind rows that are done.
    MustCommit("create function goes() returns trigger language plpgsql as 'begin perform"
               " pg_terminate_backend(pg_backend_pid()) where (select count(*) from t) = 3003; return new; end'",
               "create trigger goes before insert on t for each row execute function goes()");
    for (const char* const sql : {"insert into t values(%1)", "insert into t values(%1 + 0)", "insert into t values(%1) returning n"}) {
        for (const std::uint32_t last : {6U, 20U}) {
            insert = Prepared(sql, std::vector{Integer(1)});
            const Status status = insert->ExecuteArray(many, {0, last, false, &rows}, outcome);
            EXPECT_EQ(std::to_string(Answer(status)) + status.Detail(), "3113terminating connection due to administrator command") << sql << last;
            insert.reset();
            connection_ = Connect();
        }
    }
    EXPECT_EQ(rows.text + Query("select count(*) from t"), "3000;");
}

TEST_F(Postgres, StopIsHeededBehindSignals) {
    const Signals signals;
    std::thread breaker([this] {
        std::this_thread::sleep_for(std::chrono::milliseconds(200));
        stop_->Ask();
        connection_->Interrupt();
    });
    const auto start = std::chrono::steady_clock::now();
    EXPECT_TRUE(Query("select case when n > 2000 then pg_sleep(5) end from generate_series(1, 2001) n").ends_with(";error 1013"));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(4));
    breaker.join();
    EXPECT_TRUE(stop_->Take());
    MustCommit("create table slow(n integer)",
               "create function waits() returns trigger language plpgsql as 'begin perform pg_sleep(0.3); return null; end'",
               "create constraint trigger late after insert on slow initially deferred for each row execute function waits()");
    ASSERT_EQ(Run("insert into slow values(1)"), 0);
    stop_->Ask();
    EXPECT_EQ(Answer(connection_->Commit()), 0) << "what ends a transaction is not disturbed";
    EXPECT_TRUE(stop_->Take());
    EXPECT_EQ(Query("select n from slow"), "1;");
}

TEST_F(Postgres, Notices) {
    ASSERT_EQ(Run("create function f() returns int language plpgsql as $$ begin raise notice 'hello'; return 1; end $$"), 0);
    EXPECT_EQ(Query("select f()"), "1;");
    const auto notices = connection_->TakeNotices();
    ASSERT_EQ(notices.size(), 1u);
    EXPECT_EQ(notices[0].Number(), 20000);
    EXPECT_EQ(notices[0].Detail(), "hello");
    EXPECT_FALSE(notices[0].Failed());
    // Each row of an array tells once, in its place, however often those before the ones that fail or are refused run.
    MustCommit("create table t(n integer check (n <> 5))",
               "create function tells() returns trigger language plpgsql as 'begin raise notice ''%'', new.n; return new; end'",
               "create trigger tells before insert on t for each row execute function tells()");
    struct : engine::RowSink {
        Status Row(std::uint32_t row, std::span<const Datum>) override { return row == 2 ? Error(1406) : Status(); }
    } refuses;
    Rows rows{{Integer(0)}};
    for (int n = 1; n < 10; ++n) rows.rows.push_back({Integer(n)});
    for (const char* const sql : {"insert into t values(%1)", "insert into t values(%1 + 0)", "insert into t values(%1) returning n"}) {
        engine::ArrayOutcome outcome;
        EXPECT_EQ(Answer(Prepared(sql, rows.rows[0])->ExecuteArray(rows, {0, 10, true, &refuses}, outcome)), 0);
        std::string told;
        for (const Status& notice : connection_->TakeNotices()) told += notice.Detail();
        EXPECT_EQ(told, "0123456789") << sql;
    }
}

// What is bound, in the binary form and in texts; what is a literal in a statement.
TEST_F(Postgres, ValuesAtTheirLimits) {
    for (const char* number : {"0", "10", "100010", "0.0012", "0.00012", "-0.05", "12.34", "100.05", "123456789.123456789", "1000000",
                               "12345678901234567890123456789012345678.91"})
        EXPECT_EQ(Query("select %1::text", {Decimal(Number(number))}), std::string(number) + ';') << "of the scale that it has";
    OCINumber infinite{};
    for (const bool negative : {false, true}) {
        number::SetInfinity(negative, &infinite);
        EXPECT_EQ(Query("select %1::text", {Decimal(infinite)}), negative ? "-Infinity;" : "Infinity;");
    }
    infinite.OCINumberPart[0] = 22;
    EXPECT_EQ(Query("select %1::text", {Decimal(infinite)}), "error 1722");

    const date::DateTime leap{.year = 2024, .month = 2, .day = 29, .hour = 12};
    date::DateTime zoned = leap, ides = leap, none = leap, julian = leap;
    zoned.has_zone = true;
    zoned.zone_minutes = 330;
    ides.year = -44, ides.month = 3;
    none.day = 30;
    julian.year = 1500;
    const struct { const char* expression; Datum value; const char* text; } cases[] = {
        {"%1::timestamp", Moment(ides), "0044-03-29 12:00:00 BC;"}, {"%1::timestamp", Moment(none), "error 1839"},
        {"%1::timestamp", Moment(julian), "error 1839"}, {"%1::pg_catalog.date", Moment(leap), "2024-02-29;"},
        {"%1::timestamptz at time zone 'UTC'", Moment(zoned), "2024-02-29 06:30:00;"},
        {"pg_typeof(%1)", Moment(leap), "timestamp without time zone;"}, {"pg_typeof(%1)", Text("x"), "text;"}, {"pg_typeof(%1)", Null(), "text;"},
        {"%1::timestamp", Text("29-FEB-24 01.02.03.5 PM"), "2024-02-29 13:02:03.5;"},
        {"%1::timestamp", Text("2024-02-29 13:02:03"), "2024-02-29 13:02:03;"},
        {"%1::timestamp", Text("29-FEB-24 x"), "error 1830"}, {"%1::interval", Text("1-2"), "1-2;"},
        {"%1::interval", Text("-4 05:06:07.8"), "-4 5:06:07.8;"}, {"%1::interval", Text("7"), "error 1867"},
        {"%1::timestamp", Text("12:30:00"), "error 1843"}, {"%1::interval", Text("999999999-00"), "error 1873"},
        {"%1::integer", Text(std::string_view("1\0", 2)), "error 911"},
        {"%1::interval", Text("7 days"), "7 0:00:00;"}, {"%1::bytea", Text("0aFF"), "\\x0aff;"}};
    for (const auto& c : cases)
        EXPECT_EQ(Query("select (" + std::string(c.expression) + ")::text", {c.value}), c.text) << c.text;
    Rows forms;    // ours, and one that the server reads
    forms.rows = {{Text("1-2")}, {Text("7 days")}};
    MustRun("create table spans(s interval)");
    EXPECT_EQ(Execute(*Prepared("insert into spans values(%1)", forms.rows[0]), forms, {.first = 0, .last = 2}), 0);
    EXPECT_EQ(Query("select s::text from spans"), "1-2;7 0:00:00;");
}

// Texts are quoted in other ways than elsewhere, too: of such a list large objects are copies.
TEST_F(Postgres, ListsWithLargeObjects) {
    MustCommit("create table l(k integer, c text)", "insert into l values(3, 'three')");
    const struct { const char* sql; bool is_object; } cases[] = {
        {"select c from l where k = 3;", true}, {"select c from l where k = %1 and k = %2", true},
        {"select c from l where k = %1 and k = %2 and $$;$$ <> '--'", false}, {"select c as a$ from l", false},
        {"select c from l as a$", false}, {"select c from l where k = (array[3])[(array[1])[1]];", true}, {"select c from l where c <> '\\'", true},
        {"select c from l where c <> E'\\';'", false}};
    for (const auto& c : cases) {
        const bool has_values = std::string_view(c.sql).find('%') != std::string_view::npos;
        const std::string read = Query(c.sql, has_values ? std::vector{Integer(3), Integer(3)} : std::vector<Datum>{});
        EXPECT_TRUE(c.is_object ? read.starts_with("kind ") : read == "three;") << c.sql << ": " << read;
    }
}

TEST_F(Postgres, NamesThatAreNoneAreRefused) {
    engine::ObjectDescription object;
    std::string schema = "\xFF";
    for (const auto kind : {engine::ObjectKind::any, engine::ObjectKind::schema, engine::ObjectKind::database})
        EXPECT_EQ(Answer(connection_->Describe("\xFF", kind, object)), 911);
    EXPECT_EQ(Answer(connection_->UseSchema(schema)), 911);
    EXPECT_EQ(Run("savepoint \"A\"") + Run("rollback to a") + Run("rollback to \"A\""), 1086);
}

// Of placeholders alone, in forms that the server's arrays have. A trigger counts the statements that come.
TEST_F(Postgres, LongArraysAreOneStatement) {
    MustCommit("create table t(n numeric, v text, r tid, m timestamp)", "create table s(n integer)",
               "create function f() returns trigger language plpgsql as $$ begin insert into s values(1); return null; end $$",
               "create trigger g after insert on t execute function f()");
    const engine::RowId row{};
    const date::DateTime day{.year = 2024, .month = 1, .day = 1};
    const struct { const char* sql; std::vector<Datum> values; const char* statements; } cases[] = {
        {"insert into t(n, v) values(%1, %2)", {Integer(1), Text("x")}, "1;"},
        {"INSERT INTO T(M) VALUES ( %1 )", {Moment(day)}, "1;"},
        {"insert into t(m) values(%1)", {Text("01-JAN-24")}, "20;"},    {"insert into t(r) values(%1)", {Row(row)}, "20;"},
        {"insert into t(n) values(%1)", {Null()}, "20;"},               {"insert into t values(default)", {}, "20;"},
        {"insert into t(n) values(%1) on conflict do nothing", {Integer(1)}, "20;"},
        {"insert into t(n) values(abs(%1))", {Integer(1)}, "20;"},      {"insert into t(n) select %1", {Integer(1)}, "20;"}};
    for (const auto& c : cases) {
        Rows rows;
        rows.rows.assign(20, c.values);
        const auto insert = Prepared(c.sql, c.values);
        for (int run = 0; run < 2; ++run) EXPECT_EQ(Executed(*insert, rows, {.first = 0, .last = 20}).affected, 20u) << c.sql;
        EXPECT_EQ(Query("select count(*) / 2 from s"), c.statements) << c.sql;
        ASSERT_EQ(Run("deallocate all"), 0);                           // the engine's own, too: they are made anew
        EXPECT_EQ(Execute(*insert, rows, {.first = 0, .last = 20}), 0) << c.sql;
        EXPECT_EQ(Query("select count(*) from t"), "60;") << c.sql;
        ASSERT_EQ(Answer(connection_->Rollback()), 0);
    }
    Rows one;
    const auto truncate = Prepared("truncate t, s");
    MUST(Run("deallocate all"), Execute(*truncate, one));
    EXPECT_TRUE(Executed(*Prepared("INSERT INTO T VALUES (1)"), one).last_row);
    for (int run = 0; run < 30; ++run) MUST(Run("insert into t values(1)"), Run("deallocate all"));
    EXPECT_EQ(Query("select count(*) from t"), "31;") << "the engine's own statements are given up behind the transaction";
}

}  // namespace
