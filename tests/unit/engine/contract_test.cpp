// The contract of the door, a sentence a test, for any engine: the SQL is plain enough for all of them. What the contract
// leaves to an engine is asked of its capabilities.
#include <atomic>
#include <chrono>
#include <functional>
#include <ostream>
#include <set>
#include <thread>

#include "engine/engine_fixture.h"
#include "support/postgres_database.h"

namespace {

using engine::TransactionMode;
using namespace std::chrono_literals;

struct Engine {
    const char* name;
    std::string (*fresh_database)(const std::string& folder);    // null: on the server of the test run
    bool shared;    // several sessions see the same tables
    bool brings_lobs = false;    // short ones come with their rows
};
void PrintTo(const Engine& engine, std::ostream* out) { *out << engine.name; }

class Contract : public EngineFixture, public testing::WithParamInterface<Engine> {
protected:
    std::string FreshName() override {
        if (GetParam().fresh_database) return GetParam().fresh_database(folder_);
        server_ = std::make_unique<PostgresDatabase>();
        owner_ = server_->Owner();
        return server_->Url();
    }
    void TearDown() override {
        EngineFixture::TearDown();
        server_.reset();
    }
    void MakeNumbers(int count = 3) {
        ASSERT_EQ(Run("create table t(n integer)"), 0);
        for (int n = 1; n <= count; ++n) ASSERT_EQ(Run("insert into t values(%1)", {Integer(n)}), 0);
        ASSERT_EQ(Answer(connection_->Commit()), 0);
    }
    std::string All() { return Query("select n from t order by n"); }
    // Rows of one character each, in order.
    static std::string Sorted(const std::string& rows) {
        std::set<std::string> parts;
        for (std::size_t begin = 0, end; (end = rows.find(';', begin)) != std::string::npos; begin = end + 1)
            parts.insert(rows.substr(begin, end + 1 - begin));
        std::string sorted;
        for (const std::string& part : parts) sorted += part;
        return sorted.size() == rows.size() ? sorted : "not once each: " + rows;
    }
    std::string Count() { return Query("select count(*) from t"); }
    // Asks for a stop while a call runs.
    std::thread AskSoon() {
        return std::thread([this] {
            std::this_thread::sleep_for(50ms);
            stop_->Ask();
            connection_->Interrupt();
        });
    }

    std::string owner_ = "ann";    // who may log on as such with the password secret
    std::unique_ptr<PostgresDatabase> server_;
};

std::string Capital(std::string name) {
    name[0] = static_cast<char>(name[0] - 'a' + 'A');
    return name;
}

// What takes two sessions that see the same tables.
class SharedContract : public Contract {};

// ---- Values

// ---- Array executions

// Long enough for an engine to hand it over in another way.
TEST_P(Contract, LongArraysKeepTheirValuesAndFailTheirRows) {
    ASSERT_EQ(Run("create table t(n integer primary key, d double precision, p numeric(38), v varchar(9), m timestamp)"), 0);
    const OCINumber number = Number("-12345678901234567890123456789012345678");
    const date::DateTime moment{.year = 1999, .month = 12, .day = 31, .hour = 23, .nanosecond = 500000000};
    const std::vector<Datum> shape{Integer(1), Real(-0.25), Decimal(number), Text("\xC3\xA4 b"), Moment(moment)};
    const auto insert = Prepared("insert into t values(%1, %2, %3, %4, %5)", shape);
    Rows rows;
    rows.rows.assign(2500, shape);
    for (std::size_t row = 0; row < 2500; ++row) rows.rows[row][0] = Integer(static_cast<std::int64_t>(row));
    for (const std::size_t twice : {3u, 1500u, 1501u}) rows.rows[twice][0] = Integer(0);
    rows.rows[7] = {Integer(7), Null(), Null(), Null(), Null()};
    rows.refused_row = 2400;
    const auto outcome = Executed(*insert, rows, {.first = 0, .last = 2500, .all_rows = true});
    EXPECT_EQ(outcome.executed, 2496u);
    EXPECT_EQ(outcome.affected, 2496u);
    EXPECT_EQ(Failures(outcome), "3:1 1500:1 1501:1 2400:1722 ");
    EXPECT_EQ(Query("select * from t where n in (7, 2499) order by n"),
              "7,null,null,null,null;2499,real -0.25,decimal -12345678901234567890123456789012345678,\xC3\xA4 b,"
              "time 1999-12-31 23:00:00.5;");
    ASSERT_EQ(Answer(connection_->Rollback()), 0);
    EXPECT_EQ(Executed(*insert, rows, {.first = 4, .last = 2500}).executed, 1497u) << "0 is the first of two";
    EXPECT_EQ(Count(), "1497;");
}

TEST_P(Contract, LongArraysReturnTheirRowsAndFailTheirOwn) {
    ASSERT_EQ(Run("create table u(n integer primary key)"), 0);
    const auto insert = Prepared("insert into u values(%1) returning n", std::vector{Integer(1)});
    Rows rows;
    rows.rows.clear();
    for (int row = 0; row < 150; ++row) rows.rows.push_back({Integer(row == 70 ? 5 : row)});
    for (const bool in_transaction : {false, true}) {
        for (const bool all_rows : {false, true}) {
            if (in_transaction) {
                ASSERT_EQ(Run("insert into u values(1000)"), 0);
            }
            Written written;
            written.refused = 100;    // of row 100, since row 70 has none
            const auto outcome = Executed(*insert, rows, {0, 150, all_rows, &written});
            EXPECT_EQ(Failures(outcome), all_rows ? "70:1 100:1405 " : "70:1 ");
            EXPECT_EQ(outcome.affected, all_rows ? 148u : 70u);
            EXPECT_TRUE(written.text.ends_with(all_rows ? "148:148;149:149;" : "68:68;69:69;")) << written.text;
            EXPECT_EQ(Query("select count(*) from u where n < 1000"), all_rows ? "148;" : "70;");
            ASSERT_EQ(Answer(connection_->Rollback()), 0);
        }
    }
}

// ---- Transactions

TEST_P(Contract, MarksNest) {
    MakeNumbers(1);
    ASSERT_EQ(Answer(connection_->SetMark()), 0);
    EXPECT_TRUE(connection_->InTransaction());
    MUST(Run("insert into t values(2)"), Answer(connection_->SetMark()));
    for (const char* sql : {"insert into t values(3)", "insert into t values(4)"}) {
        MUST(Run(sql), Answer(connection_->UndoToMark()));
        EXPECT_EQ(All(), "1;2;") << "the mark stays";
    }
    MUST(Run("insert into t values(5)"), Answer(connection_->DropMark()));
    EXPECT_EQ(All(), "1;2;5;");
    MUST(Answer(connection_->UndoToMark()), Answer(connection_->DropMark()));
    EXPECT_EQ(All(), "1;") << "to the outer mark";
    EXPECT_EQ(Answer(connection_->DropMark()), 1086);
    EXPECT_TRUE(connection_->InTransaction());
    MUST(Answer(connection_->SetMark()), Answer(connection_->Commit()));
    EXPECT_EQ(Answer(connection_->UndoToMark()), 1086) << "the end of the transaction forgets them";
}

TEST_P(SharedContract, SerializableChangeBehindOthersIsRefused) {
    MakeNumbers();
    const auto other = Connect(), reader = Connect();
    ASSERT_EQ(Answer(connection_->Begin(TransactionMode::serializable)), 0);
    EXPECT_EQ(All(), "1;2;3;");
    const auto open = Prepared(*reader, "select n from t order by n");
    Rows none;
    ASSERT_EQ(Answer(open->Open(none, {})), 0);
    ASSERT_EQ(Fetched(*open, 1), "1;");
    SHOULD(Run(*other, "update t set n = 30 where n = 3"), Answer(other->Commit()));
    EXPECT_EQ(Run("update t set n = 31 where n = 3"), 8177);
    ASSERT_EQ(Answer(connection_->Rollback()), 0);
    EXPECT_EQ(All(), "1;2;30;");
    EXPECT_EQ(Run(*reader, "update t set n = n + 10"), 0) << "a write after a stale read";
    EXPECT_EQ(Rest(*open), "2;3;");
}

TEST_P(Contract, PreparedBranchIsFinishedByAnyConnectionOrRefused) {
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    engine::Xid xid{.format = -7, .global_length = 64, .branch_length = 64, .data = {'x', '\0', '\xFF'}};
    xid.data[63] = '\xA7', xid.data[125] = '\x5B', xid.data[127] = '\xFF';
    const std::string others[] = {"other", "kelp.1", "kelp.1.QQ", "kelp.x.QQ.QQ", "kelp.1.Q*.QQ", "kelp.1.QQ.Q*",
                                  "kelp.1." + std::string(87, 'A') + ".QQ"};    // whose names are like ours
    bool read_only = true;
    std::vector<engine::Xid> prepared;
    EXPECT_EQ(database_->GetCapabilities().lobs, connection_->Lobs() != nullptr);
    ASSERT_EQ(Run("insert into t values(1)"), 0);
    if (!database_->GetCapabilities().two_phase) {
        EXPECT_EQ(Answer(connection_->Prepare(xid, read_only)), 1022);
        EXPECT_EQ(Answer(connection_->CommitPrepared(xid)), 1022);
        EXPECT_EQ(Answer(connection_->RollbackPrepared(xid)), 1022);
        EXPECT_EQ(Answer(connection_->Recover(prepared)), 1022);
        EXPECT_TRUE(connection_->InTransaction()) << "the transaction is as it was";
        return;
    }
    const auto other = Connect();
    for (const bool commits : {true, false}) {
        ASSERT_EQ(Answer(connection_->Prepare(xid, read_only)), 0);
        EXPECT_FALSE(read_only);
        EXPECT_FALSE(connection_->InTransaction());
        EXPECT_EQ(All(), commits ? "" : "1;");
        bool kept[] = {false, false, true};
        EXPECT_EQ(Answer(other->KeepsPrepared(xid, kept[0])), 0);
        ASSERT_EQ(Run(*other, "deallocate all"), 0);           // the engine's own statements, too
        SHOULD(Answer(other->KeepsPrepared(xid, kept[1])), Answer(other->KeepsPrepared({.format = 1}, kept[2])));
        EXPECT_TRUE(kept[0] && kept[1] && !kept[2]);
        prepared.clear();
        for (const std::string& name : others) server_->RunHere("begin; select pg_current_xact_id(); prepare transaction '" + name + "'");
        EXPECT_EQ(Answer(other->Recover(prepared)), 0);
        for (const std::string& name : others) server_->RunHere("rollback prepared '" + name + "'");
        EXPECT_EQ(prepared, std::vector{xid});
        ASSERT_EQ(Answer(other->Begin(TransactionMode::read_write)), 0);
        EXPECT_EQ(Answer(other->CommitPrepared(xid)), 24776);
        ASSERT_EQ(Answer(other->Rollback()), 0);
        EXPECT_EQ(Answer(commits ? other->CommitPrepared(xid) : other->RollbackPrepared(xid)), 0);
        EXPECT_EQ(Answer(commits ? other->CommitPrepared(xid) : other->RollbackPrepared(xid)), 24756);
        EXPECT_EQ(All(), "1;");
        xid.branch_length = 62;
        xid.data[127] = 0;
        ASSERT_EQ(Run("insert into t values(2)"), 0);
    }
    MUST(Answer(connection_->Rollback()), Answer(connection_->Begin(TransactionMode::read_write)));
    ASSERT_EQ(Answer(connection_->Prepare(xid, read_only)), 0);
    EXPECT_TRUE(read_only) << "nothing was changed";
    EXPECT_EQ(Answer(other->CommitPrepared(xid)), 24756);
    xid = {.format = 7, .global_length = 3, .branch_length = 1, .data = {'a', 'b', 'c', 'd'}};
    ASSERT_EQ(Answer(connection_->Begin(TransactionMode::read_write)), 0);
    EXPECT_EQ(Query("select pg_current_xact_id() is null"), "0;");    // a change that only the server knows of
    ASSERT_EQ(Answer(connection_->Prepare(xid, read_only)), 0);
    EXPECT_FALSE(read_only);
    EXPECT_EQ(server_->RunHere("select gid from pg_prepared_xacts where database = current_database()"), "kelp.7.YWJj.ZA");
    EXPECT_EQ(Answer(other->RollbackPrepared(xid)), 0);
}

// ---- Open queries

TEST_P(Contract, RowThatFindsNoMemoryComesAgain) {
    MakeNumbers();
    struct : Written {
        bool throws = true;
        Status Row(std::uint32_t execution, std::span<const Datum> values) override {
            if (std::exchange(throws, false)) throw std::bad_alloc();
            return Written::Row(execution, values);
        }
    } rows;
    for (const char* form : {"plain", "scrollable", "read ahead"}) {
        const auto query = Opened("select n from t", {.scrollable = *form == 's'});
        EXPECT_EQ(Fetched(*query, 1), "1;");
        if (*form == 'r') { EXPECT_EQ(Count(), "3;"); }
        bool more = false;
        rows.throws = true;
        EXPECT_THROW((void)query->Fetch(rows, 9, more), std::bad_alloc) << form;
        EXPECT_EQ(Rest(*query), "2;3;") << form;
    }
}

TEST_P(Contract, QueryTakesItsValuesOver) {
    MakeNumbers();
    const auto query = Prepared("select %1, n from t order by n", std::vector{Text("")});
    {
        std::string text = "kept while the query is open";
        Rows source{{Text(text)}};
        ASSERT_EQ(Answer(query->Open(source, {})), 0);
        std::fill(text.begin(), text.end(), '?');
    }
    EXPECT_EQ(Fetched(*query, 1), "kept while the query is open,1;");
    EXPECT_EQ(Rest(*query), "kept while the query is open,2;kept while the query is open,3;");
}

TEST_P(Contract, OpenQueryDeliversTheRowsThatThereWereWhenItWasOpened) {
    const struct { const char* what; std::function<void()> happens; } cases[] = {
        {"a change", [&] { EXPECT_EQ(Run("update t set n = n + 10"), 0); }},
        {"a change that returns rows", [&] { EXPECT_EQ(Run("delete from t returning n"), 0); }},
        {"a definition", [&] { EXPECT_EQ(Run("drop table t"), 0); }},
        {"a commit of its own rows", [&] { EXPECT_EQ(Answer(connection_->Commit()), 0); }},
        {"a rollback of its own rows", [&] { EXPECT_EQ(Answer(connection_->Rollback()), 0); }},
        {"an undo of its own rows",
         [&] {
             SHOULD(Answer(connection_->UndoToMark()), Answer(connection_->DropMark()));
         }},
        {"a savepoint's undo", [&] { EXPECT_EQ(Run("rollback to savepoint here"), 0); }},
        {"a later query", [&] { EXPECT_EQ(Count(), "3;"); }},
        {"a begin", [&] { EXPECT_EQ(Answer(connection_->Begin(TransactionMode::read_only)), 0); }},
    };
    for (const auto& c : cases) {
        for (const bool scrollable : {false, true}) {
            MustRun("create table t(n integer)", "savepoint here");
            ASSERT_EQ(Answer(connection_->SetMark()), 0);
            ASSERT_EQ(Run("insert into t select 1 union all select 2 union all select 3"), 0);
            // Without an order, lest the engine sort, and thereby keep, the rows beforehand.
            const auto first = Opened("select n from t", {.scrollable = scrollable});
            const auto unread = Opened("select n from t", {.scrollable = scrollable});
            const std::string head = Fetched(*first, 1);
            c.happens();
            EXPECT_EQ(Sorted(head + Rest(*first)), "1;2;3;") << c.what;
            EXPECT_EQ(Sorted(Rest(*unread)), "1;2;3;") << c.what;
            first->Close();
            unread->Close();
            ASSERT_EQ(Answer(connection_->Rollback()), 0);
            (void)Run("drop table t");
        }
    }
}

TEST_P(SharedContract, LaterQuerySeesWhatOthersHaveCommitted) {
    MakeNumbers();
    const auto open = Opened("select n from t");
    const auto other = Connect();
    const std::string head = Fetched(*open, 1);
    MUST(Run(*other, "insert into t values(4)"), Answer(other->Commit()));
    EXPECT_EQ(Count(), "4;");
    EXPECT_EQ(Sorted(head + Rest(*open)), "1;2;3;");
}

// ---- Stopping

// The first of an endless query's rows is no sooner there than the query is stopped.
constexpr const char* kEndless =
    "with recursive r(n) as (select 1 union all select n + 1 from r where n < 2000000000) select max(n) from r";

TEST_P(Contract, RequestStopsTheCallThatRuns) {
    std::thread breaker = AskSoon();
    EXPECT_EQ(Query(kEndless), "error 1013");
    breaker.join();
    EXPECT_TRUE(stop_->Take()) << "the engine leaves it as it is";
    EXPECT_EQ(Query("select 1"), "1;");
}

TEST_P(Contract, StandingRequestStopsWhatExecutesAndFetches) {
    MakeNumbers();
    const auto query = Prepared("select n from t order by n");
    Rows rows{{Integer(7)}, {Integer(8)}};
    stop_->Ask();
    EXPECT_EQ(Answer(query->Open(rows, {})), 1013);
    const auto insert = Prepared("insert into t values(%1)", rows.rows[0]);
    EXPECT_EQ(Execute(*insert, rows, {.first = 0, .last = 2, .all_rows = true}), 1013);
    EXPECT_TRUE(stop_->Take());
    EXPECT_FALSE(connection_->InTransaction());
    for (const bool scrollable : {false, true}) {
        ASSERT_EQ(Answer(query->Open(rows, {.scrollable = scrollable})), 0);
        stop_->Ask();
        EXPECT_EQ(Fetched(*query, 1), "error 1013");
        EXPECT_TRUE(stop_->Take());
        EXPECT_EQ(Fetched(*query, 1), "error 1002") << "a failure closes the query, which has no end to be taken for";
    }
}

TEST_P(Contract, RequestStopsAnArrayThatTriesAllRows) {
    MustRun("create table t(n integer primary key)", "insert into t values(0)");
    struct Asking : Rows {
        engine::StopRequest& stop;
        explicit Asking(engine::StopRequest& request) : stop(request) {}
        Status Row(std::uint32_t row, std::span<Datum> values) override {
            if (row == 2) stop.Ask();
            values[0] = Integer(row);
            return {};
        }
    } rows(*stop_);
    Written written;
    for (const bool returns : {false, true}) {
        const auto insert = Prepared(returns ? "insert into t values(%1) returning n" : "insert into t values(%1)", std::vector{Integer(1)});
        const auto outcome = Executed(*insert, rows, {0, 9, true, returns ? &written : nullptr});
        EXPECT_TRUE(stop_->Take());
        EXPECT_EQ(outcome.executed, 1u);
        EXPECT_EQ(Failures(outcome), "0:1 2:1013 ");
        EXPECT_EQ(All(), "0;1;") << "rows before it stay done";
        MustRun("delete from t where n = 1");
    }
}

TEST_P(Contract, WhatEndsOrUndoesLooksAtNoRequest) {
    MakeNumbers(1);
    MUST(Answer(connection_->SetMark()), Run("insert into t values(2)"));
    const char* many = "with recursive r(n) as (select 1 union all select n + 1 from r where n < 20000) "
                       "select r.n, t.n from r, t where r.n > 19999 order by t.n";
    const auto undone = Opened(many);
    const auto rolled_back = Opened(many);
    stop_->Ask();
    SHOULD(Answer(connection_->UndoToMark()), Answer(connection_->DropMark()), Answer(connection_->Rollback()));
    EXPECT_TRUE(stop_->Take());
    EXPECT_EQ(Rest(*undone), "20000,1;20000,2;") << "rows that an undo must keep for a query are read whole";
    EXPECT_EQ(Rest(*rolled_back), "20000,1;20000,2;");
    ASSERT_EQ(Run("insert into t values(3)"), 0);
    stop_->Ask();
    EXPECT_EQ(Answer(connection_->Commit()), 0);
    EXPECT_TRUE(stop_->Take());
    EXPECT_EQ(All(), "1;3;");
}

// A thread asks without end; what a stopped step did goes to the last row.
TEST_P(Contract, UndoIsWholeHoweverOftenStopsAreAskedFor) {
    MakeNumbers(0);
    const auto insert = Prepared("insert into t values(%1)", std::vector{Integer(1)});
    Rows rows{{Integer(1)}};
    const auto open = Prepared("select n from t");
    std::atomic<bool> done = false;
    std::thread breaker([&] {
        for (int turn = 0; !done; ++turn) {
            if (turn % 3 == 0) std::this_thread::yield();
            stop_->Ask();
            connection_->Interrupt();
        }
    });
    int stopped = 0;
    const auto end = std::chrono::steady_clock::now() + 30s;
    while (stopped < 100 && std::chrono::steady_clock::now() < end) {
        (void)stop_->Take();
        if (connection_->SetMark().Failed()) continue;
        int failure = 0;
        for (int step = 0; step < 5 && failure == 0; ++step) failure = Execute(*insert, rows);
        ASSERT_TRUE(failure == 0 || failure == 1013) << failure;
        stopped += failure != 0;
        ASSERT_TRUE(connection_->InTransaction() || failure != 0);
        if (connection_->InTransaction()) {
            MUST(Answer(connection_->UndoToMark()), Answer(connection_->DropMark()));
        }
        ASSERT_EQ(Answer(connection_->Commit()), 0);
    }
    done = true;
    breaker.join();
    (void)stop_->Take();
    EXPECT_GE(stopped, 100) << "the breaker was too slow to meet a call";
    EXPECT_EQ(Count(), "0;");
}

TEST_P(SharedContract, RequestEndsAWaitForALock) {
    MakeNumbers();
    const auto other = Connect(std::make_shared<engine::StopRequest>());
    ASSERT_EQ(Run(*other, "update t set n = n + 1"), 0);
    std::thread breaker = AskSoon();
    const auto begun = std::chrono::steady_clock::now();
    EXPECT_EQ(Run("update t set n = n + 2"), 1013);
    EXPECT_LT(std::chrono::steady_clock::now() - begun, 1800ms) << "it was not waited for to the end";
    breaker.join();
    EXPECT_TRUE(stop_->Take());
}

TEST_P(Contract, ConnectionObeysWhomItServes) {
    const auto theirs = std::make_shared<engine::StopRequest>();
    connection_->Obey(theirs);
    stop_->Ask();
    EXPECT_EQ(Query("select 1"), "1;");
    theirs->Ask();
    EXPECT_EQ(Query("select 1"), "error 1013");
}

// ---- Sessions

// The names and passwords that are refused have zeros in them, too.
TEST_P(Contract, PasswordChangeIsForGood) {
    connection_.reset();
    const std::string longer("secret\0x", 8);
    EXPECT_EQ((std::vector{LogOn(owner_, longer), LogOn(owner_, "secret")}), (std::vector{1017, 0})) << "the first named logon makes the owner";
    for (const std::string& password : {std::string("Secret"), longer, std::string()})
        EXPECT_EQ(LogOn(owner_, password), 1017) << password;
    ASSERT_EQ(Answer(database_->Connect({Capital(owner_), "secret", false}, stop_, connection_)), 0);
    const struct { std::string user, old_password, new_password; int number; } refused[] = {
        {owner_, "wrong", "new", 28008}, {owner_, longer, "new", 28008}, {"bob", "secret", "new", 1017},
        {owner_, "secret", std::string("a\0b", 3), 1017}};
    for (const auto& c : refused)
        EXPECT_EQ(Answer(connection_->ChangePassword(c.user, c.old_password, c.new_password)), c.number) << c.user;
    MustRun("create table t(n integer)", "insert into t values(1)");
    EXPECT_EQ(Answer(connection_->ChangePassword(owner_, "secret", "new")), 24754) << "a rollback would undo it";
    ASSERT_EQ(Answer(connection_->Rollback()), 0);
    if (server_) {
        MustRun("set default_transaction_read_only = on");
        EXPECT_EQ(Answer(connection_->ChangePassword(owner_, "secret", "new")), 1456);
        MustRun("set default_transaction_read_only = off");
    }
    std::unique_ptr<engine::Connection> another;
    EXPECT_EQ(Answer(connection_->ChangePassword(owner_, "secret", "new")), 0);
    EXPECT_EQ(Answer(connection_->Another(stop_, another)), GetParam().shared ? 0 : 1022) << "with the new one";
    another.reset();
    ASSERT_EQ(Answer(connection_->Rollback()), 0);
    connection_.reset();
    EXPECT_EQ(LogOn(owner_, "secret"), 1017);
    EXPECT_EQ(LogOn(owner_, "new"), 0);
}

TEST_P(Contract, AnotherConnectionIsOfTheSameUserAndSeparate) {
    MakeNumbers();
    std::unique_ptr<engine::Connection> another;
    const auto theirs = std::make_shared<engine::StopRequest>();
    EXPECT_EQ(Answer(connection_->Another(theirs, another)), GetParam().shared ? 0 : 1022);
    if (!another) return;
    ASSERT_EQ(Run("insert into t values(4)"), 0);
    stop_->Ask();
    EXPECT_EQ(Query(*another, "select count(*) from t"), "3;") << "neither the other's work nor its wish is its";
    theirs->Ask();
    EXPECT_EQ(Query(*another, "select count(*) from t"), "error 1013");
}

TEST_P(Contract, SchemaTellsItsObjects) {
    MustRun("create table t(n integer)", "create view w as select n from t");
    engine::ObjectDescription object;
    ASSERT_EQ(Answer(connection_->Describe("w", engine::ObjectKind::any, object)), 0);
    const std::string schema = object.schema;
    ASSERT_EQ(Answer(connection_->Describe(schema, engine::ObjectKind::schema, object)), 0);
    EXPECT_EQ((std::set(object.members.begin(), object.members.end())), (std::set<std::string>{"T", "W"}));
    ASSERT_EQ(object.member_kinds.size(), 2u);
    EXPECT_EQ(object.member_kinds[object.members[0] == "W"], engine::ObjectKind::table);
    EXPECT_EQ(object.member_kinds[object.members[0] == "T"], engine::ObjectKind::view);
    for (const auto& [name, number] : {std::pair{"", 0}, {"nowhere", 1435}, {schema.c_str(), 0}, {"", 0}}) {
        std::string used = name;
        EXPECT_EQ(Answer(connection_->UseSchema(used)), number) << name;
        EXPECT_TRUE(number != 0 || used == schema) << used;
    }
    for (const std::string name : {"", "a b", "a;", "'t'", "\"tx", "\"\"", "\"\".t", ".t", "t.", "t;t", "t.t.t", "1t"})
        EXPECT_EQ(Answer(connection_->Describe(name, engine::ObjectKind::table, object)), 942) << name;
    EXPECT_EQ(Answer(connection_->Describe("t." + schema, engine::ObjectKind::schema, object)), 4043);
}

TEST_P(Contract, ConnectionOutlivesItsDatabase) {
    MakeNumbers();
    database_.reset();
    ASSERT_TRUE(connection_->Ping().Ok());
    EXPECT_FALSE(connection_->Broken());
    const auto query = Compiled(*connection_, "select count(*) from t", Effect::reads);
    Rows none;
    ASSERT_TRUE(query->Open(none, {}).Ok());
    EXPECT_EQ(Rest(*query), "3;");
}

TEST_P(Contract, DatabaseServesAnyNumberOfThreads) {
    ASSERT_EQ(LogOn(owner_, "secret"), 0);
    std::atomic<int> failures = 0;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([&] {
            for (int turn = 0; turn < 3; ++turn) {
                std::unique_ptr<engine::Connection> connection;
                const Status status = database_->Connect({"", "", true}, stop_, connection);
                if (status.Failed() && status.Number() != 1017) ++failures;
                if (connection && connection->Ping().Failed()) ++failures;
                if (database_->Version().empty()) ++failures;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(failures, 0);
}

// ---- Large objects, of the engines that have them

class LobContract : public Contract {
protected:
    using Kept = std::shared_ptr<engine::Lob>;

    // Takes the large objects of the rows that come.
    struct Taking : engine::RowSink {
        engine::LobStore& store;
        std::vector<Kept> lobs;
        int number = 0;
        explicit Taking(engine::LobStore& from) : store(from) {}
        Status Row(std::uint32_t, std::span<const Datum> values) override {
            if (values[0].kind == Kind::null) return {};
            EXPECT_EQ(values[0].kind, Kind::lob);
            for (const Datum& value : values)
                if (value.kind == Kind::lob) number = Answer(store.Take(value, false, lobs.emplace_back()));
            return {};
        }
    };
    void SetUp() override {
        Contract::SetUp();
        ASSERT_TRUE(database_->GetCapabilities().lobs);
        const bool has_clob = database_->GetDialect().cuts_for_update;    // the embedded one
        MustCommit(has_clob ? "create table l(k integer, c clob)" : "create table l(k integer, c text)");
        if (!has_clob)    // rows that are not in the first block
            MustCommit("insert into l select n, repeat('x', 200) from generate_series(1, 100) n", "delete from l");
        MustCommit("insert into l values(1, 'one'), (2, null), (3, 'three')");
    }
    Kept Fetch(engine::Connection& connection, const char* sql, Effect effect) {
        const auto query = Compiled(connection, effect == Effect::locks ? Locking(sql) : sql, effect);
        ::Rows none;
        Taking rows(*connection.Lobs());
        if (effect == Effect::changes) {
            Executed(*query, none, {0, 1, false, &rows});
        } else {
            bool more = true;
            SHOULD(Answer(query->Open(none, {})), Answer(query->Fetch(rows, 100, more)));
        }
        EXPECT_EQ(rows.number, 0);
        return rows.lobs.empty() ? nullptr : rows.lobs.front();
    }
    std::string Locking(const std::string& sql) const {
        return database_->GetDialect().cuts_for_update ? sql : sql + " for update";
    }
    Kept Locked(const char* sql = "select c from l where k = 3") { return Fetch(*connection_, sql, Effect::locks); }
    Kept Plain(const char* sql = "select c from l where k = 3") { return Fetch(*connection_, sql, Effect::reads); }
    static int Write(engine::Lob& lob, std::uint64_t offset, std::string_view text) {
        return Answer(lob.Write(offset, std::as_bytes(std::span(text))));
    }
    // All of it, or its error.
    static std::string Read(engine::Lob& lob, std::uint64_t offset = 0) {
        std::string text(100, '#');
        std::size_t read = 77;
        const Status status = lob.Read(offset, std::as_writable_bytes(std::span(text)), read);
        return status.Ok() ? text.substr(0, read) : "error " + std::to_string(status.Number());
    }
    std::string Stored() {
        return Query("select k, c || '' from l where c is not null order by k");
    }
};

TEST_P(LobContract, ItsRowIsKnownHoweverTheTableIsNamed) {
    const bool embedded = database_->GetDialect().cuts_for_update;
    const struct { std::string sql; Effect effect; } cases[] = {
        {embedded ? "select c from main.l where k = 3" : "select l.c from l where k = 3", Effect::locks},
        {"select all x.c word from l as x where k = 3", Effect::locks}, {"select c as word from l x where k = 3", Effect::locks},
        {embedded ? "insert or replace into l(rowid, k, c) values(3, 3, 'three') returning c;"
                  : "update l set k = 3 where k = 3 returning c", Effect::changes},
        {"update l as x set k = 3 where k = 3 returning c word", Effect::changes},
        {std::string("update l as x set k = 3 where k = 3 returning ") + (embedded ? "l.c" : "x.c"), Effect::changes}};
    for (const auto& c : cases) {
        const Kept lob = Fetch(*connection_, c.sql.c_str(), c.effect);
        ASSERT_TRUE(lob) << c.sql;
        EXPECT_EQ(Write(*lob, 5, " more"), 0) << c.sql;
        EXPECT_EQ(Stored(), "1,one;3,three more;") << c.sql;
        ASSERT_EQ(Answer(connection_->Rollback()), 0);
    }
    if (!embedded) return;
    MustRun("create view w as select * from l");
    EXPECT_EQ(Query("select c from w where k = 3"), "three;") << "whole, where its row is not known";
    const Kept replaced = Locked();
    MUST(Run("insert or replace into l(rowid, k, c) values(3, 3, 'old')"), Run("update l set c = 'new' where k = 3"));
    EXPECT_EQ(Write(*replaced, 0, "x"), 22922) << "the object of the row that another took the place of";
    MustCommit("create temp table l(k integer, c clob)", "insert into temp.l(rowid, k, c) values(3, 3, 'mine')");
    ASSERT_EQ(Answer(connection_->Begin(TransactionMode::read_write)), 0);
    const Kept other = Plain("select c from main.l where k = 3"), mine = Plain("select c from temp.l where k = 3");
    EXPECT_EQ(Write(*Locked("select c from temp.l where k = 3"), 0, "M"), 0);
    EXPECT_EQ(Read(*other) + ' ' + Read(*mine), "new error 22924") << "tables of one name";
}

TEST_P(LobContract, OneThatIsNotLockedIsReadOnlyAndWhatItWas) {
    Kept lob = Plain();
    if (GetParam().shared && !GetParam().brings_lobs) {
        EXPECT_EQ(Query(*Connect(), "pragma wal_checkpoint(truncate)"), "0,0,0;") << "nothing holds the file";
    }
    ASSERT_EQ(Answer(connection_->Begin(TransactionMode::read_write)), 0);
    const Kept inside = Plain();
    EXPECT_EQ(Write(*inside, 0, "x"), 22920);
    ASSERT_EQ(Run("update l set c = 'other' where k = 3"), 0);
    EXPECT_EQ(Read(*inside), GetParam().brings_lobs ? "three" : "error 22924");
    EXPECT_EQ(Read(*lob), GetParam().shared ? "three" : "error 22924");
    EXPECT_EQ(Write(*Plain(), 0, "O"), 0);                     // the transaction has written the row
    EXPECT_EQ(Stored(), "1,one;3,Other;");
    const Kept third = Plain();
    lob = Plain("select c from l where k = 1");
    MUST(Run("update l set c = 'uno' where k = 1"),
         Run("insert into l with recursive r(n) as (select 1 union all select n + 1 from r where n < 70000) select n + 9, null from r"));
    EXPECT_EQ((std::vector{Read(*lob) + ' ' + Read(*third), std::to_string(Write(*Plain("select c from l where k = 1"), 0, "U"))}),
              (std::vector<std::string>{GetParam().brings_lobs ? "one Other" : "error 22924 error 22924", "0"})) << "however many rows have changed since";
}

TEST_P(LobContract, RowThatIsGoneHasNoValue) {
    const Kept lob = Locked();
    ASSERT_EQ(Run("delete from l where k = 3"), 0);
    EXPECT_EQ(Read(*lob), "error 22922");
    ASSERT_EQ(Run("insert into l values(4, 'its number')"), 0);
    EXPECT_EQ(Read(*lob), "error 22922");
    EXPECT_EQ(Write(*lob, 0, "x"), 22922);
    connection_.reset();
    EXPECT_EQ(Read(*lob), "error 22275");
    EXPECT_EQ(Write(*lob, 0, "x"), 22275);
}

// Longer than what comes with a row, and than what is written as one.
TEST_P(LobContract, LongOnesAreReadAndWrittenInPieces) {
    std::string text;
    for (int number = 0; text.size() < 9'000'000; ++number) text += std::to_string(number) + "\xC3\xA4";
    const Kept lob = Locked();
    for (std::size_t at = 0; at < text.size(); at += 1'000'000)
        ASSERT_EQ(Write(*lob, at, std::string_view(text).substr(at, 1'000'000)), 0);
    ASSERT_EQ(Run("update l set k = 7 where k = 3"), 0);       // the draft is stored first
    ASSERT_EQ(Write(*lob, 4'000'000, "HERE"), 0);
    text.replace(4'000'000, 4, "HERE");
    MUST(Answer(connection_->SetMark()), Answer(lob->Trim(3)));
    EXPECT_EQ(Query("select length(c) from l where k = 7"), "2;");
    ASSERT_EQ(Answer(connection_->UndoToMark()), 0);
    EXPECT_TRUE(lob->IsSame(*Locked("select c from l where k = 7")) && !lob->IsSame(*Locked("select c from l where k = 1")));
    ASSERT_EQ(Answer(connection_->Commit()), 0);
    const Kept plain = Plain("select c from l where k = 7");
    std::uint64_t length = 0;
    EXPECT_EQ(Answer(plain->Length(length)), 0);
    EXPECT_EQ(length, text.size());
    for (const auto& kept : {lob, plain}) {
        for (const std::size_t at : {std::size_t{0}, std::size_t{65500}, std::size_t{3'999'950}, text.size() - 10})
            EXPECT_EQ(Read(*kept, at), text.substr(at, 100)) << at;
    }
    ASSERT_EQ(Run("update l set c = 'short' where k = 7"), 0);
    EXPECT_EQ(Read(*plain, 70000), GetParam().shared && !GetParam().brings_lobs ? text.substr(70000, 100) : "error 22924");
    ASSERT_EQ(Run("delete from l"), 0);
    EXPECT_EQ(Read(*lob, 8'000'000), "error 22922");
    if (!GetParam().brings_lobs) return;
    EXPECT_EQ(Read(*plain, 8'000'000), "error 22922");
    EXPECT_EQ(Query("select count(*) from pg_catalog.pg_largeobject_metadata"), "0;") << "left on the way";
}

TEST_P(LobContract, LongOnesAreReadWhileTheirRowsCome) {
    const std::string text(100'000, 'x');
    MUST(Run("update l set c = %1 where c is not null", {Text(text)}), Answer(connection_->Commit()));
    struct : engine::RowSink {
        engine::LobStore* store = nullptr;
        std::string seen;
        Status Row(std::uint32_t, std::span<const Datum> values) override {
            const std::vector<Datum> row(values.begin(), values.end());    // views that hold until the call returns
            Kept lob;
            std::uint64_t length = 0;
            Status status = row[1].kind == Kind::lob ? store->Take(row[1], true, lob) : Status();
            if (lob && status.Ok()) status = lob->Length(length);
            seen += Shown(row[0]) + (lob ? Read(*lob, 99'999) : "-") + std::to_string(length) + Shown(row[2]) + ";";
            return status;
        }
    } rows;
    rows.store = connection_->Lobs();
    for (const bool scrollable : {false, true}) {
        const auto query = Opened("select k, c, 'row ' || k from l order by k", {.scrollable = scrollable});
        bool more = true;
        EXPECT_EQ(Answer(query->Fetch(rows, 100, more)), 0);
    }
    EXPECT_EQ(rows.seen, "1x100000row 1;2-0row 2;3x100000row 3;1x100000row 1;2-0row 2;3x100000row 3;");
    if (!GetParam().brings_lobs) return;
    const Kept plain = Plain();
    const auto other = Connect();
    MUST(Run(*other, "delete from l"), Answer(other->Commit()), Run(*other, "vacuum l"), Run(*other, "alter table l set (toast_tuple_target = 128)"),
         Run(*other, "insert into l select k, repeat('y', 100000) from generate_series(1, 500) k"), Answer(other->Commit()));
    EXPECT_EQ(Read(*plain, 99'990).substr(0, 10), "error 2292") << "another row lies where it lay";
}

// Those that a server keeps for themselves, by numbers in a column: read and written in place, seen as they are now.
class ServerObjects : public LobContract {};

TEST_P(ServerObjects, AreReadAsTheyAreNow) {
    MustCommit("create domain lo as oid", "create table o(k integer, c lo)", "insert into o values(3, lo_from_bytea(0, 'three'))");
    const Kept plain = Plain("select c from o where k = 3"), joined = Plain("select o.c from o, l where o.k = 3");
    Rows values{{Integer(1)}, {Integer(0)}};
    const auto other = Connect();
    for (const char* change : {"update l set k = 3 / %1 where k = 3", "update l set k = 3 / %1 where k = 3 returning c"}) {
        Kept changed = Locked();
        Taking returned(*connection_->Lobs());
        EXPECT_EQ(Execute(*Prepared(change, values.rows[0]), values, {0, 2, false, &returned}), 1476);
        if (!returned.lobs.empty()) changed = returned.lobs.front();
        MUST(Run("update l set k = k where k = 3"), Answer(connection_->SetMark()));
        const Kept given_up = Locked("select c from l where k = 1");
        MUST(Answer(connection_->UndoToMark()), Run(*other, "update l set k = k where k = 1"), Answer(other->Commit()));
        EXPECT_EQ(Read(*changed) + ' ' + Read(*given_up), "three error 22924") << "followed as long as its own lock is not undone";
        ASSERT_EQ(Answer(connection_->Rollback()), 0);
    }
    ASSERT_EQ(Run(*other, "select lo_put(c, 0, 'T') from o where k = 3"), 0);
    EXPECT_EQ(Read(*plain) + Read(*joined), "ThreeThree");
    constexpr std::uint64_t kEnd = std::uint64_t{INT32_MAX} * 2048;
    const Kept locked = Locked("select c from o where k = 3");
    const struct { std::uint64_t at; const char* text; int number; } ends[] = {
        {kEnd, "x", 22925}, {kEnd - 1, "xy", 22925}, {std::uint64_t{1} << 42, "x", 22925}, {kEnd - 1, "x", 0}};
    for (const auto& [at, text, number] : ends) {
        EXPECT_EQ(Read(*plain, at), "") << at;
        EXPECT_EQ(Write(*locked, at, text), number) << at;
    }
    const std::uint64_t version = locked->Version();
    ASSERT_EQ(Answer(connection_->Rollback()), 0);
    EXPECT_NE(locked->Version(), version) << "the bytes are others";
    EXPECT_EQ(Write(*joined, 0, "x"), 22920);
    ASSERT_EQ(Run(*other, "select lo_unlink(c) from o where k = 3"), 0);
    EXPECT_EQ(Read(*plain), "error 22922");
    EXPECT_FALSE(connection_->InTransaction());
    connection_.reset();
    EXPECT_EQ(Read(*plain), "error 22275");
}

std::string FreshFile(const std::string& folder) { return folder + "/test.db"; }
std::string InMemory(const std::string&) { return ":memory:"; }

constexpr Engine kSqliteFile{"SqliteFile", FreshFile, true};
constexpr Engine kSqliteMemory{"SqliteMemory", InMemory, false};
constexpr Engine kPostgres{"Postgres", nullptr, true, true};
std::string NameOf(const testing::TestParamInfo<Engine>& info) { return info.param.name; }

INSTANTIATE_TEST_SUITE_P(Engines, Contract, testing::Values(kSqliteFile, kSqliteMemory, kPostgres), NameOf);
INSTANTIATE_TEST_SUITE_P(Engines, LobContract, testing::Values(kSqliteFile, kSqliteMemory, kPostgres), NameOf);
INSTANTIATE_TEST_SUITE_P(Engines, ServerObjects, testing::Values(kPostgres), NameOf);
INSTANTIATE_TEST_SUITE_P(Engines, SharedContract, testing::Values(kSqliteFile, kPostgres), NameOf);

}  // namespace
