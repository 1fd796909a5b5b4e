// A fresh database and a session on it, behind the door alone, with short forms of its calls: answers are texts and
// error numbers, so that a test reads like a table.
#pragma once

#include <gtest/gtest.h>
#include <strings.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "date/date.h"
#include "engine/engine.h"
#include "number/number.h"
#include "oci.h"
#include "support/must.h"

using engine::Datum;
using engine::Effect;
using engine::Kind;

inline Datum Null() { return {}; }
inline Datum Integer(std::int64_t value) {
    Datum datum;
    datum.kind = Kind::integer;
    datum.integer = value;
    return datum;
}
inline Datum Real(double value) {
    Datum datum;
    datum.kind = Kind::real;
    datum.real = value;
    return datum;
}
inline Datum View(Kind kind, std::string_view bytes) {
    Datum datum;
    datum.kind = kind;
    datum.length = static_cast<std::uint32_t>(bytes.size());
    datum.data = bytes.data();
    return datum;
}
inline Datum Text(std::string_view text) { return View(Kind::text, text); }
template <class T>
Datum Object(Kind kind, const T& object) {
    return View(kind, {reinterpret_cast<const char*>(&object), sizeof object});
}
inline Datum Decimal(const OCINumber& number) { return Object(Kind::decimal, number); }
inline Datum Moment(const date::DateTime& value) { return Object(Kind::timestamp, value); }
inline Datum Row(const engine::RowId& row) { return Object(Kind::row_id, row); }

inline OCINumber Number(const char* text) {
    OCINumber number;
    EXPECT_EQ(number::FromPlainText(text, '.', &number), 0) << text;
    return number;
}

inline std::string Digits(std::string_view bytes) {
    std::string text;
    char digits[3];
    for (const char byte : bytes) text.append(digits, std::snprintf(digits, 3, "%02x", static_cast<unsigned char>(byte)));
    return text;
}

inline std::string Shown(const Datum& value) {
    switch (value.kind) {
        case Kind::null: return "null";
        case Kind::integer: return std::to_string(value.integer);
        case Kind::row_id: {
            const std::string text = "row " + Digits(value.Text());
            return value.length == sizeof(engine::RowId) ? text : "row of " + std::to_string(value.length);
        }
        case Kind::real: {
            char text[40];
            std::snprintf(text, sizeof text, "real %.15g", value.real);
            return text;
        }
        case Kind::decimal: {
            char text[number::kMaxPlainText];
            std::size_t length = 0;
            number::ToPlainText(value.Number(), '.', text, &length);
            return value.length == sizeof(OCINumber) ? "decimal " + std::string(text, length) : "decimal of a bad size";
        }
        case Kind::bytes: return "bytes " + Digits(value.Text());
        case Kind::timestamp: {
            char text[date::kMaxEngineText];
            return "time " + std::string(text, date::ToEngineText(value.Timestamp(), text));
        }
        case Kind::text: return std::string(value.Text());
        default: return "kind " + std::to_string(static_cast<int>(value.kind)) + " " + std::string(value.Text());
    }
}

// Rows held as they are; one may be refused.
struct Rows : engine::RowSource {
    std::vector<std::vector<Datum>> rows;
    int refused_row = -1;
    Rows() : rows{{}} {}
    Rows(std::initializer_list<std::vector<Datum>> given) : rows(given) {}
    Status Row(std::uint32_t row, std::span<Datum> values) override {
        if (static_cast<int>(row) == refused_row) return Error(1722);
        std::copy(rows.at(row).begin(), rows.at(row).end(), values.begin());
        return {};
    }
};

// Writes rows down: columns with ',', rows with ';' behind them; "N:" before the rows of an execution but the first. The
// row of that number, from 1, is refused.
struct Written : engine::RowSink {
    std::string text;
    std::uint64_t taken = 0, refused = 0;
    Status Row(std::uint32_t execution, std::span<const Datum> values) override {
        if (++taken == refused) return Error(1405);
        if (execution > 0) text += std::to_string(execution) + ':';
        for (std::size_t index = 0; index < values.size(); ++index) text += (index ? "," : "") + Shown(values[index]);
        text += ';';
        return {};
    }
};

inline Effect EffectOf(std::string_view sql) {
    const auto begins = [&](std::string_view word) { return sql.size() > word.size() && strncasecmp(sql.data(), word.data(), word.size()) == 0; };
    if (begins("insert") || begins("update") || begins("delete")) return Effect::changes;
    if (begins("create") || begins("drop") || begins("alter")) return Effect::defines;
    if (begins("select") || begins("with") || begins("values") || begins("pragma")) return Effect::reads;
    return Effect::controls;
}

class EngineFixture : public testing::Test {
protected:
    using Stop = std::shared_ptr<engine::StopRequest>;

    // The name of a database that there is not yet.
    virtual std::string FreshName() { return folder_ + "/test.db"; }

    void SetUp() override {
        char name[] = "/tmp/kelp-engine-XXXXXX";
        folder_ = mkdtemp(name);
        ASSERT_EQ(Answer(engine::Open(FreshName(), database_)), 0);
        connection_ = Connect();
    }
    void TearDown() override {
        connection_.reset();
        database_.reset();
        std::filesystem::remove_all(folder_);
    }

    static int Answer(const Status& status) { return status.Ok() ? 0 : status.Number(); }

    std::unique_ptr<engine::Connection> Connect(Stop stop = nullptr) {
        std::unique_ptr<engine::Connection> connection;
        const Status status = database_->Connect({"", "", true}, stop ? stop : stop_, connection);
        EXPECT_TRUE(status.Ok()) << status.Number() << ' ' << status.Detail();
        return connection;
    }
    int LogOn(const std::string& user, const std::string& password) {
        std::unique_ptr<engine::Connection> connection;
        return Answer(database_->Connect({user, password, false}, stop_, connection));
    }
    // Placeholders are written %1, %2.
    std::string Spelled(std::string_view sql) const {
        std::string text;
        for (std::size_t at = 0; at < sql.size(); ++at) {
            const bool is_placeholder = sql[at] == '%' && at + 1 < sql.size() && sql[at + 1] >= '1' && sql[at + 1] <= '9';
            if (is_placeholder) text += database_->GetDialect().placeholder(static_cast<std::size_t>(sql[++at] - '0'));
            else text += sql[at];
        }
        return text;
    }
    Status Compile(engine::Connection& connection, std::string_view sql, std::unique_ptr<engine::Query>& query,
                   std::span<const Datum> values = {}) const {
        const std::string text = Spelled(sql);
        std::vector<Kind> kinds;
        for (const Datum& value : values) kinds.push_back(value.kind);
        std::uint32_t offset = 0;
        return connection.Compile({text, EffectOf(sql), kinds}, query, offset);
    }
    std::unique_ptr<engine::Query> Prepared(engine::Connection& connection, std::string_view sql,
                                            std::span<const Datum> values = {}) const {
        std::unique_ptr<engine::Query> query;
        const Status status = Compile(connection, sql, query, values);
        EXPECT_TRUE(status.Ok()) << sql << ": " << status.Number() << ' ' << status.Detail();
        return query;
    }
    std::unique_ptr<engine::Query> Prepared(std::string_view sql, std::span<const Datum> values = {}) const {
        return Prepared(*connection_, sql, values);
    }
    static std::unique_ptr<engine::Query> Compiled(engine::Connection& on, const std::string& sql, Effect effect) {
        std::unique_ptr<engine::Query> query;
        std::uint32_t offset = 0;
        EXPECT_EQ(Answer(on.Compile({sql, effect, {}}, query, offset)), 0) << sql;
        return query;
    }
    static engine::ArrayOutcome Executed(engine::Query& query, engine::RowSource& rows, engine::ArrayRun run = {}) {
        engine::ArrayOutcome outcome;
        EXPECT_EQ(Answer(query.ExecuteArray(rows, run, outcome)), 0);
        return outcome;
    }
    static int Execute(engine::Query& query, engine::RowSource& rows, const engine::ArrayRun& run = {}) {
        engine::ArrayOutcome outcome;
        const Status status = query.ExecuteArray(rows, run, outcome);
        if (!status.Ok()) return status.Number();
        return outcome.failures.empty() ? 0 : outcome.failures.front().status.Number();
    }
    // Runs a statement once; answers the number of its error, 0 for none.
    int Run(engine::Connection& connection, std::string_view sql, std::vector<Datum> values = {}) const {
        std::unique_ptr<engine::Query> query;
        if (const int error = Answer(Compile(connection, sql, query, values))) return error;
        ::Rows rows{values};
        return Execute(*query, rows);
    }
    int Run(std::string_view sql, std::vector<Datum> values = {}) const { return Run(*connection_, sql, values); }
    template <class... Sql>
    void MustRun(const Sql&... texts) const {
        for (const std::string_view sql : {std::string_view(texts)...}) ASSERT_EQ(Run(sql), 0) << sql;
    }
    template <class... Sql>
    void MustCommit(const Sql&... texts) const {
        MustRun(texts...);
        ASSERT_EQ(Answer(connection_->Commit()), 0);
    }
    // "row:number " for each.
    static std::string Failures(const engine::ArrayOutcome& outcome) {
        std::string all;
        for (const auto& [row, status] : outcome.failures)
            all += std::to_string(row) + ':' + std::to_string(status.Number()) + ' ';
        return all;
    }

    // All rows of a query, or those that came before its error.
    std::string Query(engine::Connection& connection, std::string_view sql, std::vector<Datum> values = {}) const {
        std::unique_ptr<engine::Query> query;
        if (const int error = Answer(Compile(connection, sql, query, values))) return "error " + std::to_string(error);
        ::Rows rows{values};
        const Status status = query->Open(rows, {});
        return status.Ok() ? Rest(*query) : "error " + std::to_string(status.Number());
    }
    std::string Query(std::string_view sql, std::vector<Datum> values = {}) const {
        return Query(*connection_, sql, values);
    }
    static std::string Rest(engine::Query& query) { return Fetched(query, 1000000000); }
    static std::string Fetched(engine::Query& query, std::uint32_t most) {
        Written rows;
        bool more = true;
        const Status status = query.Fetch(rows, most, more);
        return status.Ok() ? rows.text : rows.text + "error " + std::to_string(status.Number());
    }
    std::unique_ptr<engine::Query> Opened(std::string_view sql, const engine::QueryRun& run = {}) const {
        auto query = Prepared(sql);
        ::Rows none;
        EXPECT_EQ(Answer(query->Open(none, run)), 0) << sql;
        return query;
    }

    std::string folder_;
    Stop stop_ = std::make_shared<engine::StopRequest>();
    std::unique_ptr<engine::Database> database_;
    std::unique_ptr<engine::Connection> connection_;
};
