// SQL text: kinds of statements, placeholders, blocks, and the rewriting into an engine's spellings.
#include <gtest/gtest.h>

#include <chrono>

#include "sql/engine_text.h"
#include "sql/statement_text.h"

namespace {

using sql::StatementType;

constexpr engine::Dialect::Spelling kTypes[] = {
    {"varchar2", "varchar"}, {"number", "numeric"}, {"raw", "blob"}, {"long raw", "blob"}, {"decfloat", "numeric"}};
constexpr engine::Dialect::Spelling kFunctions[] = {{"sysdate", "(now())"}};
constexpr engine::Dialect::Spelling kCasts[] = {{"timestamp", "to_ts"}, {"char", "to_char"}};

engine::Dialect TestDialect() {
    return {
        .placeholder = [](std::size_t number) { return '?' + std::to_string(number); },
        .types = kTypes,
        .functions = kFunctions,
        .casts = kCasts,
        .counts_characters = "_c",
        .dual = "(select 'X' as dummy)",
        .minus = "except",
        .truncate_table = "delete from",
        .cuts_for_update = true,
        .date_literal =
            [](const date::DateTime& value, bool) {
                char text[date::kMaxEngineText];
                return "'" + std::string(text, date::ToEngineText(value, text)) + "'";
            },
        .row_id_literal = [](const engine::RowId& row) { return std::to_string(row.bytes.back()); },
    };
}

std::string Rewritten(std::string_view text) {
    const sql::StatementText statement = sql::Scan(text);
    std::string all;
    for (const sql::Step& step : statement.steps) {
        if (!all.empty()) all += " | ";
        all += sql::Rewrite(text, statement, step, TestDialect()).sql;
    }
    return all;
}

// Names of the placeholders, "+" before one that repeats, "@" before one that is a row id.
std::string Names(const sql::StatementText& statement) {
    std::string names;
    for (std::size_t index = 0; index < statement.placeholders.size(); ++index) {
        const sql::Placeholder& placeholder = statement.placeholders[index];
        if (index > 0) names += ' ';
        if (placeholder.first != index) names += '+';
        if (placeholder.is_row_id) names += '@';
        names += placeholder.name;
        if (!placeholder.indicator.empty()) names += '/' + placeholder.indicator;
    }
    return names;
}

TEST(SqlText, PlaceholdersForRowIds) {
    const struct { const char* text; const char* names; } cases[] = {
        {"select * from t where rowid = :r and :s < t.rowid and rowid in (:u, 'x', :v) and a = :w", "@R @S @U @V W"},
        {"insert into t values(:a:ind, :b, :a)", "A/IND B +A"}, {"select /*/:f*/ :a from t where rowid <:g", "A @G"},
    };
    for (const auto& c : cases) EXPECT_EQ(Names(sql::Scan(c.text)), c.names) << c.text;
}

TEST(SqlText, Blocks) {
    const struct { const char* text; const char* rewritten; } cases[] = {
        {"begin open :c for select * from t where a = :a; end;", "select * from t where a = ?1"},
        {"BEGIN OPEN :c FOR select ';' from t; OPEN :d FOR values(:v); END", "select ';' from t | values(?1)"},
        {"begin insert into t values(:a, :a); commit; end name;", "insert into t values(?1, ?2) | commit"},
        {"begin :x := :y * 2; null; end;", "select ?1 * 2 | "},
        {"begin select a, b into :x, :y from t where c = :z; end;", "select a, b  from t where c = ?1"}};
    for (const auto& c : cases) {
        const sql::StatementText statement = sql::Scan(c.text);
        EXPECT_EQ(statement.error, 0) << c.text;
        EXPECT_TRUE(statement.is_block) << c.text;
        EXPECT_EQ(Rewritten(c.text), c.rewritten) << c.text;
    }
    EXPECT_EQ(sql::Scan("begin :x := :y * 2; end;").steps[0].targets, std::vector<std::uint32_t>{0});
    EXPECT_EQ(sql::Scan("begin select a, b into :x, :y from t; end;").steps[0].targets,
              (std::vector<std::uint32_t>{0, 1}));
}

TEST(SqlText, SpellingsOfTheEngine) {
    const struct { const char* text; const char* rewritten; } cases[] = {
        {"select :b, :a, :b from t", "select ?1, ?2, ?3 from t"},
        {"select sysdate, t.sysdate, sysdate(1), 'sysdate' as sysdate",
         "select (now()), t.sysdate, sysdate(1), 'sysdate' as sysdate"},
        {"select 1 from dual", "select 1 from (select 'X' as dummy) as dual"},
        {"select 1 minus select 2", "select 1 except select 2"},
        {"select date 'x' minus select date '2024-2-9' minus select 1",
         "select date 'x' except select '2024-02-09 00:00:00' except select 1"},
        {"select minus from t", "select minus from t"},
        {"select d.dummy from DUAL d where 1=1", "select d.dummy from (select 'X' as dummy) d where 1=1"},
        {"create table t(number number(10,2), raw long raw, v varchar2(20 char), x number(*,3))",
         "create table t(number numeric(10,2), raw blob, v varchar_c(20 ), x numeric(38,3))"},
        {"create table t(a number, primary key(number, raw), b number default 1 * 2)",
         "create table t(a numeric, primary key(number, raw), b numeric default (1 * 2))"},
        {"create table t(a number default -1 not null, b date default sysdate, c number default f(1, 2) unique)",
         "create table t(a numeric default -1 not null, b date default (now()), c numeric default (f(1, 2)) unique)"},
        {"create table t(a number default (1) + 2, b number default null null, c char(3) default nvl(null, user) unique)",
         "create table t(a numeric default ((1) + 2), b numeric default null null, c char(3) default (nvl(null, user)) unique)"},
        {"alter table t add a number default 1 + 1 not null", "alter table t add a numeric default (1 + 1) not null"},
        {"alter table t add a number default .5", "alter table t add a numeric default .5"},
        {"alter table t add a number default 1 + 1", "alter table t add a numeric default (1 + 1)"},
        {"create table t(a varchar2(9 byte), b nvarchar2(9), c char(9 char), d char varying(2 CHAR) default 'x')",
         "create table t(a varchar(9 ), b nvarchar2(9), c char_c(9 ), d char varying_c(2 ) default 'x')"},
        {"select cast(a as char(9 char)), cast(a as char(9 byte)), cast(a as char(*, 3)) from t",
         "select to_char_c(a , 9), to_char(a , 9), to_char(a , 38, 3) from t"},
        {"alter table number add number number", "alter table number add number numeric"},
        {"alter table t alter column number type number(5)", "alter table t alter column number type numeric(5)"},
        {"create trigger g after insert on t begin update l set a = :new.a; end",
         "create trigger g after insert on t begin update l set a = :new.a; end"},
        {"select cast(cast(:1 as decfloat(34)) as varchar2(9)), number, count(*) from t",
         "select cast(cast(?1 as numeric(34)) as varchar(9)), number, count(*) from t"},
        {"(select * from t)", "(select * from t)"},
        {"select cast( cast(a as char(9)) as timestamp(6) with time zone), cast(b as timestamp) as char from t",
         "select to_ts( to_char(a , 9) , 6), to_ts(b ) as char from t"},
        {"select q'{it's}', nq'!x!' from t", "select 'it''s', 'x' from t"},
        {"select a from t for update nowait", "select a from t "},
        {"insert into t values(date '2024-2-9', timestamp '2024-02-09 10:11:12.5', date 'x')",
         "insert into t values('2024-02-09 00:00:00', '2024-02-09 10:11:12.5', date 'x')"},
        {"insert into t values(:a :b, :c:i)", "insert into t values(?1 ?2, ?3)"}, {"select 1 ;  ", "select 1"},
        {"truncate table t", "delete from t"},
    };
    for (const auto& c : cases) EXPECT_EQ(Rewritten(c.text), c.rewritten) << c.text;
}

// What one dialect asks for and another does not.
TEST(SqlText, SpellingsThatADialectAsksFor) {
    static constexpr engine::Dialect::Spelling kNoSize[] = {{"raw", "bytea", true}};
    static constexpr engine::Dialect::Spelling kCalls[] = {{"nvl", "coalesce"}};
    static constexpr engine::Dialect::DecodeText kDecode{"[", "|is ", "|then ", "|or ", "|else ", "]"};
    engine::Dialect dialect = TestDialect();
    dialect.types = kNoSize;
    dialect.calls = kCalls;
    dialect.row_id = "ctid";
    dialect.subquery_alias = " as q";
    dialect.quoted_name = [](std::string_view) { return std::string("\"q\""); };
    dialect.bytes_literal = [](std::string_view digits) { return "<" + std::string(digits) + ">"; };
    dialect.empty_text = "null";
    dialect.decode = &kDecode;
    const struct { const char* text; const char* rewritten; } cases[] = {
        {"create table t(a raw(9) not null, b raw)", "create table t(a bytea not null, b bytea)"},
        {"create table t(a raw(9", "create table t(a bytea"},
        {"create trigger g after insert on t begin update l set a = decode(b, 1, 2); end",
         "create trigger g after insert on t begin update l set a = decode(b, 1, 2); end"},
        {"select nvl(a, ''), b.nvl(1), nvl from t", "select coalesce(a, null), b.nvl(1), nvl from t"},
        {"select rowid, t.rowid from t", "select ctid, t.ctid from t"},
        {"select x'0A', x from \"T\"", "select <0A>, x from \"q\""}, {"select x '0A' from t", "select x '0A' from t"},
        {"select decode(:a, 1, 'x', 2, f(3, 4)), decode(a, 1, 2, 3) from t",
         "select [?1|is  1|then  'x'|or  2|then  f(3, 4)], [a|is  1|then  2|else  3] from t"},
        {"select decode(a, 1, f(3, 4), 3) from t", "select [a|is  1|then  f(3, 4)|else  3] from t"},
        {"select decode(a, decode(b, 1, 2), 3), decode(a, 'hex') from t",
         "select [a|is  [b|is  1|then  2]|then  3], decode(a, 'hex') from t"},
        {"select (select 1) from (select 2), (values(1)) join (select 3) x on 1 = 1 where a in (select 4)",
         "select (select 1) from (select 2) as q1, (values(1)) as q2 join (select 3) x on 1 = 1 where a in (select 4)"},
        {"select f(from_a, (select 1)), (select b from (select 2 from t)) from t",
         "select f(from_a, (select 1)), (select b from (select 2 from t) as q1) from t"}};
    for (const auto& c : cases) {
        const sql::StatementText statement = sql::Scan(c.text);
        EXPECT_EQ(sql::Rewrite(c.text, statement, statement.steps[0], dialect).sql, c.rewritten) << c.text;
    }
}

TEST(SqlText, EngineOffsetsPointIntoTheApplicationsText) {
    const std::string_view text = "begin open :c for select :abc, sysdate, wrong from dual; end;";
    const sql::StatementText statement = sql::Scan(text);
    const sql::EngineText engine = sql::Rewrite(text, statement, statement.steps[0], TestDialect());
    EXPECT_EQ(engine.SourceOffset(engine.sql.find("wrong")), text.find("wrong"));
    EXPECT_EQ(engine.SourceOffset(engine.sql.find("now")), text.find("sysdate"));
    EXPECT_EQ(engine.SourceOffset(0), text.find("select"));
}

// Deep nesting, quotes that never close, comments within comments, placeholders without end: all linear.
TEST(SqlText, HostileTextsTakeBoundedTime) {
    const auto repeat = [](std::string_view piece) {
        std::string text = "select ";
        while (text.size() < 200000) text += piece;
        return text;
    };
    const auto start = std::chrono::steady_clock::now();
    for (const char* piece : {"(", "cast(", "'", "\"", "/*", "--\n", ":a ", "?", "rowid in (", "with ", ";",
                              "for update ",
                              "q'", "q'[", "e+", "begin ", "into :x,", "rowid = "}) {
        const std::string text = repeat(piece);
        const sql::StatementText statement = sql::Scan(text);
        for (const sql::Step& step : statement.steps) sql::Rewrite(text, statement, step, TestDialect());
        const sql::StatementText block = sql::Scan("begin " + text);
        for (const sql::Step& step : block.steps) sql::Rewrite(text, block, step, TestDialect());
    }
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(30));
}

}  // namespace
