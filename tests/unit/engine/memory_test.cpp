// Memory that is short, at every place where something is allocated, the library's own and SQLite's: once, or from there
// on. Nothing is lost or kept that the answers do not tell, and with memory the next call works.
#include <sqlite3.h>

#include <new>

#include "engine/engine_fixture.h"

namespace {

// How many more allocations succeed; below 0: all.
thread_local long allowed = -1;
thread_local bool fails_once = false;
thread_local long failed = 0;

bool Fails() {
    if (allowed < 0) return false;
    if (allowed > 0) {
        --allowed;
        return false;
    }
    ++failed;
    if (fails_once) allowed = -1;
    return true;
}

sqlite3_mem_methods plain;
void* SqliteMalloc(int size) { return Fails() ? nullptr : plain.xMalloc(size); }
void* SqliteRealloc(void* block, int size) { return Fails() ? nullptr : plain.xRealloc(block, size); }

// Before SQLite is first used.
const bool configured = [] {
    sqlite3_config(SQLITE_CONFIG_GETMALLOC, &plain);
    sqlite3_mem_methods mine = plain;
    mine.xMalloc = SqliteMalloc;
    mine.xRealloc = SqliteRealloc;
    return sqlite3_config(SQLITE_CONFIG_MALLOC, &mine) == SQLITE_OK;
}();

}  // namespace

void* operator new(std::size_t size) {
    void* block = Fails() ? nullptr : std::malloc(size > 0 ? size : 1);
    return block ? block : throw std::bad_alloc();
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    return Fails() ? nullptr : std::malloc(size > 0 ? size : 1);
}
void operator delete(void* block) noexcept { std::free(block); }
void operator delete(void* block, std::size_t) noexcept { std::free(block); }

namespace {

constexpr int kOutOfMemory = 1019;

class Memory : public EngineFixture {
protected:
    std::string FreshName() override { return ":memory:"; }

    // Runs an action with the allocation at `position` failing, or all from there on. The number of its error.
    template <class Action>
    static int Short(long position, bool once, Action action) {
        failed = 0;
        fails_once = once;
        allowed = position;
        int answer = 0;
        try {
            answer = Answer(action());
        } catch (const std::bad_alloc&) {
            answer = kOutOfMemory;
        }
        allowed = -1;
        return answer;
    }
    // Runs a check for every place at which an allocation of `scene` can fail, once and for good.
    template <class Scene>
    void AtEveryAllocation(Scene scene) {
        for (const bool once : {true, false}) {
            for (long position = 0; position < 5000; ++position) {
                SCOPED_TRACE((once ? "only allocation " : "from allocation ") + std::to_string(position));
                scene(position, once);
                if (HasFatalFailure()) return;
                if (failed == 0) break;
            }
        }
    }
    void MakeRows() {
        ASSERT_TRUE(configured);
        ASSERT_EQ(Run("create table t(n integer, v varchar2(3000), c char(300), d date)"), 0);
        ASSERT_EQ(Run("with recursive r(n) as (select 1 union all select n + 1 from r where n < 60) insert into t "
                      "select n, hex(zeroblob(n * 20)), 'c' || n, '2024-02-29 00:00:00' from r"), 0);
        ASSERT_EQ(Answer(connection_->Commit()), 0);
    }
};

// Counts rows that come in order and whole; has no need of memory.
struct InOrder : engine::RowSink {
    std::int64_t last = 0;
    bool right = true;
    Status Row(std::uint32_t, std::span<const Datum> values) override {
        right = right && values[0].integer == ++last && values[1].length == static_cast<std::uint32_t>(last) * 40 &&
                values[2].length == 300 && values[3].kind == Kind::timestamp;
        return {};
    }
};

// An open query is fetched from, read ahead by a change, and fetched to its end: it delivers every row or an error.
TEST_F(Memory, RowsAreDeliveredOrAnErrorIs) {
    MakeRows();
    for (const bool scrollable : {false, true}) {
        AtEveryAllocation([&](long position, bool once) {
            auto query = Opened("select n, v, c, d from t where v >= '' order by n", {.scrollable = scrollable});
            auto insert = Prepared("insert into t(n) values(1000)");
            InOrder rows;
            bool more = true;
            Rows none;
            engine::ArrayOutcome outcome;
            int answer = Short(position, once, [&] {
                Status status = query->Fetch(rows, 5, more);
                if (status.Ok()) status = insert->ExecuteArray(none, {}, outcome);
                if (status.Ok() && !outcome.failures.empty()) return std::move(outcome.failures[0].status);
                return status.Ok() ? query->Fetch(rows, 5, more) : std::move(status);
            });
            ASSERT_TRUE(answer == 0 || answer == kOutOfMemory) << answer;
            if (query->IsOpen()) answer = Answer(query->Fetch(rows, 1000, more));
            ASSERT_TRUE(rows.right);
            ASSERT_TRUE(answer == 0 ? rows.last == 60 : answer == kOutOfMemory) << answer << " behind " << rows.last;
            ASSERT_EQ(Answer(connection_->Rollback()), 0);
            ASSERT_EQ(Query("select count(*) from t"), "60;");
        });
    }
}

TEST_F(Memory, QueryThatCannotBeOpenedIsNotOpen) {
    MakeRows();
    AtEveryAllocation([&](long position, bool once) {
        std::unique_ptr<engine::Query> query;
        std::uint32_t offset = 0;
        const OCINumber number = Number("12345678901234567890.5");
        const date::DateTime moment{.year = 2024, .month = 2, .day = 29};
        Rows source{{Text("text"), Decimal(number), Moment(moment)}};
        const int answer = Short(position, once, [&] {
            Status status = connection_->Compile({"select n, v, c, d, ?1, to_char(n), nvl(?2, 1) from t where d = ?3 "
                                                  "and to_char(d, 'YYYY') = '2024' and n < 10", Effect::reads, {}},
                                                 query, offset);
            return status.Ok() ? query->Open(source, {}) : std::move(status);
        });
        ASSERT_TRUE(answer == 0 || answer == kOutOfMemory) << answer;
        if (!query) return;
        ASSERT_EQ(query->IsOpen(), answer == 0);
        InOrder rows;
        bool more = false;
        ASSERT_EQ(Answer(query->Open(source, {})), 0);
        ASSERT_EQ(Answer(query->Fetch(rows, 100, more)), 0);
        ASSERT_TRUE(rows.right && rows.last == 9);
        ASSERT_EQ(Query("select 1"), "1;");
    });
}

// An array between a mark and its undo: the outcome counts what is there, and the undo leaves nothing.
TEST_F(Memory, WhatIsCountedIsThereAndWhatIsUndoneIsGone) {
    ASSERT_EQ(Run("create table t(n integer primary key, v varchar2(100), d date)"), 0);
    ASSERT_EQ(Run("create table log(n integer)"), 0);
    ASSERT_EQ(Run("create trigger g after insert on t begin insert into log values(new.n); end"), 0);
    Rows source;
    source.rows.clear();
    const std::string text(100, 'x');
    for (int row = 0; row < 12; ++row) source.rows.push_back({Integer(row == 5 ? 4 : row), Text(text)});
    const auto insert = Prepared("insert into t values(?1, to_char(?2) || '', kelp_sysdate()) returning n, v");
    const auto drain = [&](bool memory_is_back, long position, bool once) {
        engine::ArrayOutcome outcome;
        Written rows;
        int undone = 0;
        const int answer = Short(position, once, [&] {
            Status status = connection_->SetMark();
            if (!status.Ok()) return status;
            const engine::ArrayRun run{.first = 0, .last = 12, .all_rows = true, .returned = &rows};
            try {
                status = insert->ExecuteArray(source, run, outcome);
            } catch (const std::bad_alloc&) {
                status = Error(kOutOfMemory);
            }
            if (memory_is_back) allowed = -1;
            else if (connection_->InTransaction()) undone = Answer(connection_->UndoToMark());
            return status;
        });
        ASSERT_TRUE(answer == 0 || answer == kOutOfMemory) << answer;
        if (memory_is_back) {
            const std::string there = Query("select count(*) from t");
            ASSERT_EQ(there, std::to_string(answer == 0 ? outcome.executed : 0) + ';');
            ASSERT_EQ(outcome.affected, outcome.executed);
            for (const auto& failure : outcome.failures) {
                const int number = failure.status.Number();
                ASSERT_TRUE(number == kOutOfMemory || (number == 1 && failure.row == 5)) << number;
            }
        } else if (undone != 0) {
            ASSERT_FALSE(connection_->InTransaction()) << undone;
        }
        if (memory_is_back && connection_->InTransaction()) {
            const int restored = Answer(connection_->UndoToMark());
            ASSERT_TRUE(restored == 0 || (restored == 1086 && answer != 0)) << restored;
        }
        ASSERT_EQ(Query("select count(*) from t"), "0;");
        ASSERT_EQ(Query("select count(*) from log"), "0;");
        ASSERT_EQ(Answer(connection_->Rollback()), 0);
    };
    AtEveryAllocation([&](long position, bool once) { drain(true, position, once); });
    AtEveryAllocation([&](long position, bool once) { drain(false, position, once); });
}

TEST_F(Memory, SessionsBeginOrDoNot) {
    ASSERT_EQ(Run("create table kept(n integer)"), 0);
    connection_.reset();
    AtEveryAllocation([&](long position, bool once) {
        std::unique_ptr<engine::Connection> connection;
        engine::ObjectDescription object;
        const int answer = Short(position, once, [&] {
            Status status = database_->Connect({"", "", true}, stop_, connection);
            return status.Ok() ? connection->Describe("kept", engine::ObjectKind::table, object) : std::move(status);
        });
        ASSERT_TRUE(answer == 0 || answer == kOutOfMemory) << answer;
        ASSERT_EQ(object.columns.empty(), answer != 0);
        connection.reset();
        ASSERT_EQ(Query(*Connect(), "select count(*) from kept"), "0;");
    });
}

TEST_F(Memory, DatabasesOpenOrDoNot) {
    AtEveryAllocation([&](long position, bool once) {
        std::unique_ptr<engine::Database> database;
        const int answer = Short(position, once, [&] { return engine::Open(folder_ + "/x.db", database); });
        ASSERT_TRUE(answer == 0 || answer == kOutOfMemory) << answer;
        ASSERT_EQ(database != nullptr, answer == 0);
    });
}

}  // namespace
