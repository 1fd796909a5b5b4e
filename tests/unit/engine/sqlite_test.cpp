// The contract of the engine interface, on SQLite: values in and out, what array executions do, errors by number, open
// queries beside writes, cancelling, accounts, broken databases.
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <thread>

#include "engine/engine.h"
#include "number/number.h"
#include "oci.h"

namespace {

namespace fs = std::filesystem;
using engine::Datum;
using engine::Kind;

Datum Null() { return {}; }
Datum Integer(std::int64_t value) {
    Datum datum;
    datum.kind = Kind::integer;
    datum.integer = value;
    return datum;
}
Datum Bytes(Kind kind, std::string_view bytes) {
    Datum datum;
    datum.kind = kind;
    datum.length = static_cast<std::uint32_t>(bytes.size());
    datum.data = bytes.data();
    return datum;
}
Datum Text(std::string_view text) { return Bytes(Kind::text, text); }
Datum Decimal(const OCINumber& number) {
    return Bytes(Kind::decimal, {reinterpret_cast<const char*>(&number), sizeof number});
}

// Rows held as they are; a row may refuse.
struct Rows : engine::RowSource {
    std::vector<std::vector<Datum>> rows;
    int refused_row = -1;
    Rows(std::initializer_list<std::vector<Datum>> given) : rows(given) {}
    Status Row(std::uint32_t row, std::span<Datum> values) override {
        if (static_cast<int>(row) == refused_row) return Error(1722);
        std::copy(rows.at(row).begin(), rows.at(row).end(), values.begin());
        return {};
    }
};

std::string Shown(const Datum& value) {
    switch (value.kind) {
        case Kind::null: return "null";
        case Kind::integer: return std::to_string(value.integer);
        case Kind::row_id: return "row " + std::to_string(value.integer);
        case Kind::real: {
            char text[40];
            std::snprintf(text, sizeof text, "real %.15g", value.real);
            return text;
        }
        case Kind::decimal: {
            char text[number::kMaxPlainText];
            std::size_t length = 0;
            number::ToPlainText(*static_cast<const OCINumber*>(value.data), '.', text, &length);
            return "decimal " + std::string(text, length);
        }
        case Kind::bytes: return "bytes " + std::to_string(value.length);
        case Kind::timestamp: return "time " + std::string(value.Text());
        default: return std::string(value.Text());
    }
}

class EngineTest : public testing::Test {
protected:
    void SetUp() override {
        char name[] = "/tmp/kelp-engine-XXXXXX";
        folder_ = mkdtemp(name);
        connection_ = Open();
    }
    void TearDown() override {
        connection_.reset();
        fs::permissions(folder_, fs::perms::owner_all);
        fs::remove_all(folder_);
    }

    std::string File() const { return folder_ + "/test.db"; }
    std::unique_ptr<engine::Connection> Open() { return Open(File()); }
    static std::unique_ptr<engine::Connection> Open(const std::string& file) {
        std::unique_ptr<engine::Connection> connection;
        const Status status = engine::Connect(file, connection);
        EXPECT_TRUE(status.Ok()) << status.Number() << ' ' << status.Detail();
        return connection;
    }
    std::unique_ptr<engine::Query> Prepare(const std::string& sql) { return Prepare(*connection_, sql); }
    static std::unique_ptr<engine::Query> Prepare(engine::Connection& connection, const std::string& sql) {
        std::unique_ptr<engine::Query> query;
        std::uint32_t offset = 0;
        const Status status = connection.Prepare(sql, query, offset);
        EXPECT_TRUE(status.Ok()) << sql << ": " << status.Number() << ' ' << status.Detail();
        return query;
    }
    // Runs a statement without placeholders once; answers the number of its error, 0 for none.
    int Run(const std::string& sql) { return Run(*connection_, sql); }
    static int Run(engine::Connection& connection, const std::string& sql) {
        std::unique_ptr<engine::Query> query;
        std::uint32_t offset = 0;
        Status status = connection.Prepare(sql, query, offset);
        if (status.Failed()) return status.Number();
        engine::ArrayOutcome outcome;
        Rows none{{}};
        status = query->ExecuteArray(none, 0, 1, false, outcome);
        if (status.Failed()) return status.Number();
        return outcome.failures.empty() ? 0 : outcome.failures.front().status.Number();
    }
    std::string Query(const std::string& sql, std::vector<Datum> values = {}) {
        return Query(*connection_, sql, values);
    }
    // All rows: columns with ',', rows with ';' behind them.
    static std::string Query(engine::Connection& connection, const std::string& sql, std::vector<Datum> values = {}) {
        auto query = Prepare(connection, sql);
        if (!query) return "not prepared";
        Rows source{values};
        const Status status = query->Open(source, 0);
        return status.Ok() ? Rest(*query) : "error " + std::to_string(status.Number());
    }
    static std::string Rest(engine::Query& query) {
        std::string text;
        std::vector<Datum> values(query.Columns().size());
        bool more = true;
        for (;;) {
            const Status status = query.Fetch(values, more);
            if (status.Failed()) return text + "error " + std::to_string(status.Number());
            if (!more) return text;
            for (std::size_t index = 0; index < values.size(); ++index)
                text += (index ? "," : "") + Shown(values[index]);
            text += ';';
        }
    }
    static bool Step(engine::Query& query) {
        std::vector<Datum> values(query.Columns().size());
        bool more = false;
        EXPECT_TRUE(query.Fetch(values, more).Ok());
        return more;
    }

    std::string folder_;
    std::unique_ptr<engine::Connection> connection_;
};

OCINumber Number(const char* text) {
    OCINumber number;
    EXPECT_EQ(number::FromPlainText(text, '.', &number), 0) << text;
    return number;
}

TEST_F(EngineTest, NumbersKeepEveryDigit) {
    ASSERT_EQ(Run("create table t(n number)"), 0);
    const struct { const char* text; const char* stored; } cases[] = {
        {"0", "0"}, {"-1", "-1"}, {"123.45", "real 123.45"}, {"9223372036854775807", "9223372036854775807"},
        {"-9223372036854775808", "-9223372036854775808"}, {"9223372036854775808", "decimal 9223372036854775808"},
        {"123456789012345.5", "decimal 123456789012345.5"}, {"12345678901234.5", "real 12345678901234.5"},
        {"-1234567890123456789012345678901234567.8", "decimal -1234567890123456789012345678901234567.8"},
        {"100000000000000000000", "real 1e+20"}};
    for (const auto& c : cases) {
        ASSERT_EQ(Run("delete from t"), 0);
        const OCINumber number = Number(c.text);
        Rows rows{{Decimal(number)}};
        engine::ArrayOutcome outcome;
        ASSERT_TRUE(Prepare("insert into t values(?1)")->ExecuteArray(rows, 0, 1, false, outcome).Ok());
        EXPECT_EQ(Query("select n from t"), std::string(c.stored) + ';') << c.text;
        EXPECT_EQ(Query("select count(*) from t where n = ?1", {Decimal(number)}), "1;") << c.text;
        EXPECT_EQ(Query("select max(n) from t"), std::string(c.stored) + ';') << "without a declaration: " << c.text;
    }
}

TEST_F(EngineTest, LongLiteralsKeepEveryDigit) {
    ASSERT_EQ(Run("create table t(n number)"), 0);
    ASSERT_EQ(Run("insert into t values(-123456789012345678901234567890.5), (1), (12345678901234567890)"), 0);
    EXPECT_EQ(Query("select n from t"), "decimal -123456789012345678901234567890.5;1;decimal 12345678901234567890;");
}

TEST_F(EngineTest, ValuesComeBackAsTheirColumnsAreDeclared) {
    ASSERT_EQ(Run("create table t(c char(4), v varchar2(10), d date, r raw(4), b blob, i integer)"), 0);
    Rows rows{{Text("ab"), Text("ab"), Text("2024-02-29 12:00:00"), Bytes(Kind::bytes, "xy"), Null(), Integer(7)}};
    engine::ArrayOutcome outcome;
    ASSERT_TRUE(Prepare("insert into t values(?1, ?2, ?3, ?4, ?5, ?6)")->ExecuteArray(rows, 0, 1, false, outcome).Ok());
    EXPECT_EQ(Query("select * from t"), "ab  ,ab,time 2024-02-29 12:00:00,bytes 2,null,7;");
    EXPECT_EQ(Query("select t.rowid, count(*) from t"), "row 1,1;");
}

// The same value through a placeholder, as a literal, from a query and by an update.
TEST_F(EngineTest, ColumnsTakeWhatTheirDeclarationSays) {
    ASSERT_EQ(
        Run("create table t(n number(5,2), w number(3,-2), i integer, f number, v varchar2(3), c char(4), d date, "
            "s timestamp, r raw(2), x kelp_decfloat(16), b clob)"),
        0);
    const struct { const char* column; const char* literal; const char* outcome;
    } cases[] = {{"n", "'12.345'", "real 12.35"},
                 {"n", "999.99", "real 999.99"},
                 {"n", "999.995", "error 1438"},
                 {"n", "-1000", "error 1438"},
                 {"n", "'abc'", "error 1722"},
                 {"n", "x'01'", "error 932"},
                 {"n", "7", "7"},
                 {"n", "''", "null"},
                 {"n", "1.005e2", "real 100.5"},
                 {"w", "12345", "12300"},
                 {"w", "99950", "error 1438"},
                 {"i", "2.5", "3"},
                 {"i", "' 12 '", "12"},
                 {"f", "'123456789012345678901234567890.5'", "decimal 123456789012345678901234567890.5"},
                 {"f", "1e300", "error 1426"},
                 {"v", "'abc'", "abc"},
                 {"v", "'abcd'", "error 12899"},
                 {"v", "'\xC3\xA4\xC3\xA4'", "error 12899"},
                 {"v", "12", "12"},
                 {"c", "'ab  '", "ab  "},
                 {"c", "'abcde'", "error 12899"},
                 {"c", "'abcd   '", "abcd"},
                 {"d", "'03-FEB-24'", "time 2024-02-03 00:00:00"},
                 {"d", "'2024-02-03'", "time 2024-02-03 00:00:00"},
                 {"d", "'2024-02-03 04:05:06.7'", "time 2024-02-03 04:05:06"},
                 {"d", "'30-FEB-24'", "error 1839"},
                 {"d", "'x'", "error 1858"},
                 {"d", "5", "error 932"},
                 {"s", "'03-FEB-24 04.05.06.5 PM'", "time 2024-02-03 16:05:06.5"},
                 {"r", "'0aFF'", "bytes 2"},
                 {"r", "'0aFF00'", "error 12899"},
                 {"r", "'0g'", "error 1465"},
                 {"r", "x'0102'", "bytes 2"},
                 {"x", "'1.23456789012345678'", "decimal 1.234567890123457"},
                 {"b", "'any text at all'", "any text at all"},
                 {"n", "null", "null"}};
    for (const auto& c : cases) {
        const std::string column = c.column;
        const std::string literal = c.literal;
        const std::string want = std::string(c.outcome) + ';';
        const auto outcome = [&](int error) {
            return error ? "error " + std::to_string(error) + ';' : Query("select " + column + " from t");
        };
        const auto fresh = [&](const char* row) {
            ASSERT_EQ(Run("delete from t"), 0);
            ASSERT_EQ(Run(row), 0);
        };
        fresh("select 1");
        EXPECT_EQ(outcome(Run("insert into main.t(" + column + ") values(" + literal + ")")), want) << literal;
        fresh("select 1");
        EXPECT_EQ(outcome(Run("insert into t(" + column + ") select " + literal + " where 1 = 1")), want)
            << "query " << literal;
        fresh("insert into t(n) values(null)");
        EXPECT_EQ(outcome(Run("update t set r = null, " + column + " = " + literal + " where 1 = 1")), want)
            << "update " << literal;
        if (literal.front() != '\'') continue;
        fresh("select 1");
        Rows rows{{Text(std::string_view(literal).substr(1, literal.size() - 2))}};
        engine::ArrayOutcome bound;
        ASSERT_TRUE(Prepare("insert into t(" + column + ") values(?1)")->ExecuteArray(rows, 0, 1, false, bound).Ok());
        EXPECT_EQ(outcome(bound.failures.empty() ? 0 : bound.failures[0].status.Number()), want) << "bound " << literal;
    }
}

TEST_F(EngineTest, ColumnsAreDescribed) {
    ASSERT_EQ(Run("create table t(a number(12,2) not null, b varchar2(20), c CHAR (5), d timestamp_tz(3), "
                  "e number, f clob, g \"odd type\", id integer primary key, h kelp_decfloat(34), i number(5))"), 0);
    const auto query = Prepare("select a, b as \"Mixed\", c, d, e, f, g, id, h, i, 1+1, cast(a as blob), rowid, "
                               "kelp_varchar(kelp_decfloat(e , 16) , 9) || 'x', count(kelp_date(b )) from t");
    struct Expected { const char* name; int type; unsigned size; int precision; int scale; bool nullable; };
    const Expected expected[] = {{"A", SQLT_NUM, 22, 12, 2, false},
                                 {"Mixed", SQLT_CHR, 20, 0, 0, true},
                                 {"C", SQLT_AFC, 5, 0, 0, true},
                                 {"D", SQLT_TIMESTAMP_TZ, 13, 0, 3, true},
                                 {"E", SQLT_NUM, 22, 0, -127, true},
                                 {"F", SQLT_CLOB, 4000, 0, 0, true},
                                 {"G", SQLT_CHR, 0, 0, 0, true},
                                 {"ID", SQLT_NUM, 22, 38, 0, false},
                                 {"H", SQLT_BDOUBLE, 16, 34, -127, true},
                                 {"I", SQLT_NUM, 22, 5, 0, true},
                                 {"1+1", SQLT_NUM, 22, 0, -127, true},
                                 {"CAST(A AS BLOB)", SQLT_BLOB, 4000, 0, 0, true},
                                 {"ROWID", SQLT_RDD, 18, 0, 0, false},
                                 {"CAST(CAST(E AS DECFLOAT(16)) AS VARCHAR2(9)) || 'x'", SQLT_CHR, 0, 0, 0, true},
                                 {"COUNT(CAST(B AS DATE))", SQLT_NUM, 22, 0, -127, true}};
    const auto& columns = query->Columns();
    ASSERT_EQ(columns.size(), std::size(expected));
    for (std::size_t index = 0; index < columns.size(); ++index) {
        const auto& want = expected[index];
        EXPECT_EQ(columns[index].name, want.name);
        EXPECT_EQ(columns[index].type, want.type) << want.name;
        EXPECT_EQ(columns[index].size, want.size) << want.name;
        EXPECT_EQ(columns[index].precision, want.precision) << want.name;
        EXPECT_EQ(columns[index].scale, want.scale) << want.name;
        EXPECT_EQ(columns[index].nullable, want.nullable) << want.name;
    }
}

TEST_F(EngineTest, CastsKeepDigitsAndDates) {
    const OCINumber pi = Number("3.141592653589793238462643383279502884");
    const struct { const char* sql; const char* rows; } cases[] = {
        {"values(kelp_varchar(kelp_decfloat(?1, 34), 100))", "3.141592653589793238462643383279503;"},
        {"values(kelp_varchar(kelp_decfloat(?1, 16), 100))", "3.141592653589793;"},
        {"values(kelp_number(?1, 5, 2))", "real 3.14;"},
        {"values(kelp_number(?1, 2, 2))", "error 1438"},
        {"select kelp_number('x' || ?1)", "error 1722"},
        {"select kelp_varchar('äöü' || ifnull(substr(?1, 1, 0), ''), 2), kelp_char('a', 3)", "ä,a  ;"},
        {"select kelp_date('2024-02-30'), ?1", "error 1839"},
        {"select kelp_date('2024-02-29T13:14:15.5'), substr(?1, 1, 0)", "time 2024-02-29 13:14:15,null;"}};
    for (const auto& c : cases) EXPECT_EQ(Query(c.sql, {Decimal(pi)}), c.rows) << c.sql;
}

TEST_F(EngineTest, FunctionsOfDatesNumbersAndText) {
    const struct { const char* list; const char* row; } cases[] = {
        {"to_char('2024-02-09 13:14:15'), to_char('2024-02-09 13:14:15', 'YYYY/MM/DD HH24:MI')",
         "09-FEB-24,2024/02/09 13:14;"},
        {"to_char(1234.5, '9,999.00'), to_char(0.5), to_char('abc'), to_char(99.96, '99.9'), to_char(null, '9')",
         " 1,234.50,.5,abc,#####,null;"},
        {"to_char('x', '99')", "error 1722"}, {"to_char(1, 'Q')", "error 1481"},
        {"to_date('09.02.2024', 'DD.MM.YYYY'), to_date('9-feb-24')",
         "time 2024-02-09 00:00:00,time 2024-02-09 00:00:00;"},
        {"to_date('2024-13-01', 'YYYY-MM-DD')", "error 1843"}, {"to_date('x', 'YYYY')", "error 1858"},
        {"to_timestamp('090224 5', 'DDMMRR FF')", "time 2024-02-09 00:00:00.5;"},
        {"to_date('2024 5', 'YYYY FF')", "error 1821"},
        {"to_number('-1.50'), to_number('1,234', '9,999'), to_number(null)", "real -1.5,1234,null;"},
        {"to_number('1x')", "error 1722"}, {"to_number('1x', '99')", "error 1722"},
        {"add_months('2024-01-31 10:00:00', 1), add_months('2024-02-29', -12)",
         "time 2024-02-29 10:00:00,time 2023-02-28 00:00:00;"},
        {"add_months('2024-01-31', 1000000)", "error 1841"}, {"add_months(5, 1)", "error 932"},
        {"add_months('10:00:00', 1)", "error 932"},
        {"months_between('2024-03-31', '2024-02-29'), months_between('2024-01-01', '2024-02-17'),"
         " months_between('0001-01-05', '-0001-01-05')", "1,decimal -1.51612903225806451612903225806451612903,12;"},
        {"last_day('2024-02-01 01:02:03'), next_day('2024-02-09', 'friday'), next_day('2024-02-09', 1)",
         "time 2024-02-29 01:02:03,time 2024-02-16 00:00:00,time 2024-02-11 00:00:00;"},
        {"next_day('2024-02-09', 'nonday')", "error 1846"},
        {"trunc(2.79), trunc(-2.79, 1), trunc(1279, -2), trunc('5.5')", "2,real -2.7,1200,5;"},
        {"trunc('2024-02-09 13:14:15'), trunc(to_date('09-02-24', 'DD-MM-YY'), 'yyyy')",
         "2024-02-09 00:00:00,time 2024-01-01 00:00:00;"},
        {"trunc('2024-08-15 13:14:15', 'q'), trunc('2024-08-15', 'iw'), trunc('2024-08-15', 'd'),"
         " trunc('2024-08-15', 'ww'), trunc('2024-08-15', 'w'), trunc('2000-08-15', 'cc')",
         "2024-07-01 00:00:00,2024-08-12 00:00:00,2024-08-11 00:00:00,2024-08-12 00:00:00,2024-08-15 00:00:00,"
         "1901-01-01 00:00:00;"},
        {"trunc('2024-08-15', 'xx')", "error 1898"},
        {"hextoraw('abc'), rawtohex(x'0aff'), rawtohex('A')", "bytes 2,0AFF,41;"}, {"hextoraw('0g')", "error 1465"},
        {"decode(2, 1, 'a', 2, 'b'), decode(null, 1, 'a', null, 'n'), decode(3, 1, 'a'), decode(3, 1, 'a', 'else'),"
         " decode('1', 1, 'same')", "b,n,null,else,same;"},
        {"decode('x', 1, 'a')", "error 1722"}, {"decode(1, 2)", "error 938"},
        {"greatest(1, 10, 9), least('b', 'a', 'c'), greatest(1, null), least(0.5)", "10,a,null,real 0.5;"},
        {"greatest()", "error 938"},
        {"initcap('the QUICK-fox o''neil äB')", "The Quick-Fox O'Neil äb;"},
        {"lpad('ä', 4, 'xö'), rpad('abc', 2), lpad('x', 0), rpad(5, 3, '*'), lpad('x', 3, '')",
         "xöxä,ab,null,5**,null;"},
        {"instr('banana', 'an'), instr('banana', 'an', 1, 2), instr('banana', 'an', -1), instr('banana', 'an', -1, 2),"
         " instr('äöa', 'a'), instr('a', 'a', 0), instr('aaa', 'a', -3, 2), instr('a', 'a', 9)", "2,4,4,2,3,0,0,0;"},
        {"instr('a', 'a', 1, 0)", "error 1428"},
        {"substr('äbc', 0, 2), substr('abc', -2), substr('abc', -5, 3), substr('abc', 2, -1), substr('abc', 4),"
         " substr(1.5, 1, 2), substr(x'010203', 2)", "äb,bc,null,null,null,1.,bytes 2;"}};
    for (const auto& c : cases) EXPECT_EQ(Query(std::string("select ") + c.list), c.row) << c.list;
}

TEST_F(EngineTest, CallsAreDescribedBeforeTheyRun) {
    const auto query = Prepare("select to_date(null), trunc(last_day(null)), to_number(null), hextoraw(null),"
                               " nvl(add_months(null, 1), 2), decode(1, 2, months_between(null, 1)) as m");
    const struct { const char* name; int type; } columns[] = {
        {"TO_DATE(NULL)", SQLT_DAT}, {"TRUNC(LAST_DAY(NULL))", SQLT_DAT}, {"TO_NUMBER(NULL)", SQLT_NUM},
        {"HEXTORAW(NULL)", SQLT_BIN}, {"NVL(ADD_MONTHS(NULL, 1), 2)", SQLT_DAT}, {"M", SQLT_NUM}};
    ASSERT_EQ(query->Columns().size(), std::size(columns));
    for (std::size_t index = 0; index < std::size(columns); ++index) {
        EXPECT_EQ(query->Columns()[index].name, columns[index].name);
        EXPECT_EQ(query->Columns()[index].type, columns[index].type) << columns[index].name;
    }
}

TEST_F(EngineTest, ArrayStopsAtTheFirstFailureUnlessAllRowsAreTried) {
    ASSERT_EQ(Run("create table t(n integer primary key)"), 0);
    const auto insert = Prepare("insert into t values(?1)");
    Rows rows{{Integer(1)}, {Integer(1)}, {Integer(2)}, {Integer(2)}, {Integer(3)}};
    engine::ArrayOutcome stopped;
    ASSERT_TRUE(connection_->Begin().Ok());
    ASSERT_TRUE(insert->ExecuteArray(rows, 0, 5, false, stopped).Ok());
    EXPECT_EQ(stopped.executed, 1u);
    ASSERT_EQ(stopped.failures.size(), 1u);
    EXPECT_EQ(stopped.failures[0].row, 1u);
    EXPECT_EQ(stopped.failures[0].status.Number(), 1);
    EXPECT_EQ(Query("select n from t"), "1;") << "the row before the failure stays";

    rows.refused_row = 4;
    engine::ArrayOutcome all;
    ASSERT_TRUE(insert->ExecuteArray(rows, 1, 5, true, all).Ok());
    EXPECT_EQ(all.executed, 1u);
    EXPECT_EQ(all.affected, 1u);
    ASSERT_EQ(all.failures.size(), 3u);
    EXPECT_EQ(all.failures[2].row, 4u);
    EXPECT_EQ(all.failures[2].status.Number(), 1722) << "what the source refuses";
    ASSERT_TRUE(connection_->Rollback().Ok());
    EXPECT_EQ(Query("select count(*) from t"), "0;");
}

TEST_F(EngineTest, ErrorsHaveTheirNumbers) {
    ASSERT_EQ(Run("create table p(id integer primary key, n number not null, u varchar2(9) unique, check (n < 100))"),
              0);
    ASSERT_EQ(Run("create table c(p integer references p(id))"), 0);
    ASSERT_EQ(Run("create table late(p integer references p(id) deferrable initially deferred)"), 0);
    ASSERT_EQ(Run("insert into p values(1, 1, 'a')"), 0);
    ASSERT_EQ(Run("insert into c values(1)"), 0);
    const struct { const char* sql; int number; } cases[] = {
        {"insert into p values(1, 1, 'b')", 1}, {"insert into p values(2, 1, 'a')", 1},
        {"insert into p values(2, null, 'b')", 1400}, {"update p set n = null", 1407},
        {"insert into p values(2, 100, 'b')", 2290}, {"insert into c values(9)", 2291}, {"delete from p", 2292},
        {"select * from nowhere", 942}, {"select none from p", 904}, {"insert into p(zz) values(1)", 904},
        {"insert into p values(1, 2)", 947}, {"insert into p values(1, 2, 3, 4)", 913}, {"create table p(x int)", 955},
        {"create table q(x int, x int)", 957}, {"selct 1", 900}, {"select 'abc", 911}, {"select (", 921}, {"", 900},
        {"-- nothing", 900}, {"select 1; select 2", 933}, {"select sum(sum(n)) from p", 934}, {"drop index none", 1418},
        {"select abs() from p", 909}, {"select n from p group by n having max(n, sum(min(n))) > 1", 934},
        {"select id from p, c where p = id union select 1, 2", 1789}, {"select id from p, late, c where p = 1", 918},
        {"rollback to nowhere", 1086}};
    for (const auto& c : cases) EXPECT_EQ(Run(c.sql), c.number) << c.sql;

    ASSERT_TRUE(connection_->Begin().Ok());
    ASSERT_EQ(Run("insert into late values(77)"), 0);
    EXPECT_EQ(connection_->Commit().Number(), 2091) << "a deferred constraint undoes the transaction";
    EXPECT_FALSE(connection_->InTransaction());
}

// Each condition with its text as a literal and through a placeholder.
TEST_F(EngineTest, ComparisonsReadValuesAsTheirColumns) {
    ASSERT_EQ(Run("create table t(id integer, d date, c char(5), n number, r raw(2), v varchar2(9))"), 0);
    ASSERT_EQ(Run("create table u(id integer, e timestamp, v number)"), 0);
    ASSERT_EQ(Run("insert into t values(1, '03-FEB-24', 'ab', 5, '0A', 'x ')"), 0);
    ASSERT_EQ(Run("insert into t values(2, '01-DEC-99', 'abc', 10, '0B', 'x')"), 0);
    ASSERT_EQ(Run("insert into u values(1, '03-FEB-24 10.00.00 AM', 1)"), 0);
    const struct { const char* condition; const char* text; const char* rows; } cases[] = {
        {"d = %", "03-FEB-24", "1;"}, {"d <= %", "01-JAN-20", "2;"}, {"% < t.d", "01-JAN-20", "1;"},
        {"d not between '01-JAN-00' and %", "31-DEC-20", "1;2;"}, {"d >= %", "tomorrow", "error 1858"},
        {"c = %", "ab   ", "1;"}, {"c in ('q', %)", "ab ", "1;"}, {"c not in (%)", "ab ", "2;"},
        {"c <> %", "abc     ", "1;"},
        {"n > %", "7", "2;"}, {"n = %", "x", "error 1722"}, {"r = %", "0a", "1;"}, {"v = %", "x", "2;"},
        {"(d = % or 1 = 0)", "03-FEB-24", "1;"}, {"substr(c, 1, 2) = %", "ab", "1;2;"},
        {"exists(select 1 from u where u.e > % and u.id = t.id)", "02-FEB-24 09.00.00 AM", "1;"}};
    for (const auto& c : cases) {
        const std::string condition = c.condition;
        const std::size_t place = condition.find('%');
        const auto with = [&](const std::string& value) { return std::string(condition).replace(place, 1, value); };
        const auto query = [&](const std::string& value) { return "select id from t where " + with(value); };
        const std::string want = c.rows;
        EXPECT_EQ(Query(query('\'' + std::string(c.text) + '\'')), want) << condition << ' ' << c.text;
        EXPECT_EQ(Query(query("?1"), {Text(c.text)}), want) << "bound " << condition << ' ' << c.text;
        if (want[0] == 'e') continue;
        EXPECT_EQ(Run("update t set n = n where " + with('\'' + std::string(c.text) + '\'')), 0) << condition;
    }
    EXPECT_EQ(Query("select t.id from t, u x where t.id = x.id and e > '03-FEB-24 09.59.00 AM'"), "1;");
    EXPECT_EQ(Query("select t.id from t join u on t.id = u.id where t.v = 'x '"), "1;") << "two columns, two types";
}

TEST_F(EngineTest, RefusedValueNamesItsColumn) {
    ASSERT_EQ(Run("create table t(v varchar2(3))"), 0);
    Rows rows{{Text("long")}};
    for (const char* sql : {"insert into t values(?1)", "insert into t values('lo' || substr(?1, 3))"}) {
        engine::ArrayOutcome outcome;
        ASSERT_TRUE(Prepare(sql)->ExecuteArray(rows, 0, 1, false, outcome).Ok());
        ASSERT_EQ(outcome.failures.size(), 1u) << sql;
        EXPECT_EQ(outcome.failures[0].status.Number(), 12899);
        EXPECT_EQ(outcome.failures[0].status.Detail(), "column V, actual 4, maximum 3") << sql;
    }
}

TEST_F(EngineTest, SyntaxErrorTellsItsPlace) {
    std::unique_ptr<engine::Query> query;
    std::uint32_t offset = 0;
    const Status status = connection_->Prepare("select 1 frm t", query, offset);
    EXPECT_EQ(status.Number(), 900);
    EXPECT_EQ(offset, 13u);
    EXPECT_STREQ(status.Engine(), "SQLITE");
    EXPECT_FALSE(query);
}

TEST_F(EngineTest, OpenQueryNeitherHindersNorSeesAnotherSessionsCommit) {
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    ASSERT_EQ(Run("insert into t values(1), (2), (3)"), 0);
    const auto other = Open();
    Rows none{{}};
    const auto open = Prepare("select n from t");
    ASSERT_TRUE(open->Open(none, 0).Ok());
    ASSERT_TRUE(Step(*open));
    EXPECT_EQ(Run(*other, "insert into t values(4)"), 0);

    EXPECT_EQ(Query("select count(*) from t"), "4;") << "a query begun later sees it";
    ASSERT_TRUE(connection_->Begin().Ok()) << "a write after a stale read";
    EXPECT_EQ(Run("update t set n = n + 10"), 0);
    EXPECT_EQ(Rest(*open), "2;3;") << "the open query shows what it was opened on";
    ASSERT_TRUE(connection_->Rollback().Ok());
}

TEST_F(EngineTest, QueryIsDescribedAnewWhenItsTableHasChanged) {
    ASSERT_EQ(Run("create table t(a integer)"), 0);
    ASSERT_EQ(Run("insert into t values(1)"), 0);
    const auto query = Prepare("select * from t");
    Rows none{{}};
    ASSERT_TRUE(query->Open(none, 0).Ok());
    EXPECT_EQ(Rest(*query), "1;");
    ASSERT_EQ(Run("alter table t add b char(3)"), 0);
    ASSERT_EQ(Run("update t set b = 'x'"), 0);
    ASSERT_TRUE(query->Open(none, 0).Ok());
    EXPECT_EQ(Rest(*query), "1,x  ;");
}

TEST_F(EngineTest, OpenQueryOutlivesWritesDropsAndRollbackOfItsOwnSession) {
    ASSERT_EQ(Run("create table t(n integer, v varchar2(2000))"), 0);
    ASSERT_EQ(Run("with recursive r(n) as (select 1 union all select n + 1 from r where n < 40000) "
                  "insert into t select n, hex(zeroblob(600)) from r"), 0);    // 48 MB: more than stays in memory
    Rows none{{}};
    const auto open = Prepare("select n, v from t order by n");
    ASSERT_TRUE(open->Open(none, 0).Ok());
    ASSERT_TRUE(Step(*open));
    ASSERT_EQ(Run("drop table t"), 0);
    std::vector<Datum> values(2);
    bool more = true;
    for (std::int64_t row = 2; row <= 40000; ++row) {
        ASSERT_TRUE(open->Fetch(values, more).Ok() && more) << row;
        ASSERT_EQ(values[0].integer, row);
        ASSERT_EQ(values[1].length, 1200u);
        ASSERT_EQ(values[1].Text().find_first_not_of('0'), std::string_view::npos) << row;
    }
    ASSERT_TRUE(open->Fetch(values, more).Ok());
    EXPECT_FALSE(more);
}

TEST_F(EngineTest, LockedDatabaseAnswersAfterAWhile) {
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    const auto other = Open();
    ASSERT_TRUE(other->Begin().Ok());
    EXPECT_EQ(connection_->Begin().Number(), 54);
    EXPECT_EQ(Query("select count(*) from t"), "0;") << "readers go on";
    ASSERT_TRUE(other->Rollback().Ok());
    EXPECT_TRUE(connection_->Begin().Ok());
}

TEST_F(EngineTest, CancelStopsTheRunningCallOrTheNextOne) {
    const char* endless = "with recursive r(n) as (select 1 union all select n + 1 from r) select max(n) from r";
    std::thread breaker([&] {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        connection_->Cancel();
    });
    EXPECT_EQ(Query(endless), "error 1013");
    breaker.join();
    EXPECT_EQ(Query("select 1"), "1;");
    connection_->Cancel();
    EXPECT_EQ(Query("select 1"), "error 1013");

    const auto other = Open();
    ASSERT_TRUE(other->Begin().Ok());
    std::thread waiter([&] {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        connection_->Cancel();
    });
    EXPECT_EQ(connection_->Begin().Number(), 1013) << "while it waits for a lock";
    waiter.join();
    connection_->Cancel();
    connection_->ForgetCancel();
    EXPECT_EQ(Query("select 1"), "1;");
}

TEST_F(EngineTest, FirstNamedLogonOwnsTheDatabase) {
    EXPECT_TRUE(connection_->Authenticate({"", "", true}).Ok()) << "no accounts: anybody of the system";
    EXPECT_EQ(connection_->ChangePassword("ann", "secret", "other").Number(), 1017) << "no accounts";
    EXPECT_TRUE(connection_->Authenticate({"ann", "secret", false}).Ok());
    const auto other = Open();
    EXPECT_TRUE(other->Authenticate({"ANN", "secret", false}).Ok());
    EXPECT_EQ(other->Authenticate({"ann", "Secret", false}).Number(), 1017);
    EXPECT_EQ(other->Authenticate({"ann", std::string("secret\0x", 8), false}).Number(), 1017);
    EXPECT_EQ(other->Authenticate({"bob", "secret", false}).Number(), 1017);
    EXPECT_TRUE(other->Authenticate({"", "", true}).Ok()) << "the owner of the file";
    EXPECT_EQ(other->ChangePassword("ann", "wrong", "new").Number(), 28008);
    EXPECT_TRUE(other->ChangePassword("ann", "secret", "new").Ok());
    EXPECT_EQ(connection_->Authenticate({"ann", "secret", false}).Number(), 1017);
    EXPECT_TRUE(connection_->Authenticate({"ann", "new", false}).Ok());
    EXPECT_EQ(Query("select substr(password, 1, 3) from kelp_accounts"), "$y$;");
}

TEST_F(EngineTest, BrokenDatabasesHaveTheirNumbers) {
    ASSERT_EQ(Run("create table t(n integer, v text)"), 0);
    ASSERT_EQ(Run("insert into t values(1, 'kept')"), 0);
    std::unique_ptr<engine::Connection> none;
    EXPECT_EQ(engine::Connect(folder_ + "/no/such/folder/x.db", none).Number(), 12154);
    EXPECT_EQ(engine::Connect("postgresql://localhost/x", none).Number(), 21520);
    EXPECT_EQ(engine::Connect(folder_ + "/", none).Number(), 12154);
    std::ofstream(folder_ + "/text.db") << std::string(5000, 'x');
    EXPECT_EQ(engine::Connect(folder_ + "/text.db", none).Number(), 1210);
    EXPECT_FALSE(none);

    EXPECT_EQ(Query("pragma max_page_count = 10"), "10;");
    EXPECT_EQ(Run("insert into t values(2, zeroblob(100000))"), 1653) << "full";
    EXPECT_EQ(Query("select n, v from t"), "1,kept;");

    EXPECT_EQ(Query("pragma query_only = 1"), "");
    EXPECT_EQ(Run("insert into t values(3, 'x')"), 16000) << "read-only";
}

}  // namespace
