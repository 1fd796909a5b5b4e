// SQL text, rewritten into an engine's spellings: any text, and the time that hostile ones take.
#include <gtest/gtest.h>

#include <chrono>
#include <random>

#include "sql/engine_text.h"
#include "sql/statement_text.h"

namespace {

constexpr engine::Dialect::Spelling kTypes[] = {{"varchar2", "varchar"}, {"number", "numeric"}};
constexpr engine::Dialect::Spelling kFunctions[] = {{"sysdate", "(now())"}};
constexpr engine::Dialect::Spelling kCasts[] = {{"timestamp", "to_ts"}, {"char", "to_char"}};
constexpr engine::Dialect::DecodeText kDecode{"[", "|is ", "|then ", "|or ", "|else ", "]"};

engine::Dialect TestDialect() {
    engine::Dialect dialect;
    dialect.placeholder = [](std::size_t number) { return '?' + std::to_string(number); };
    dialect.types = kTypes;
    dialect.functions = kFunctions;
    dialect.casts = kCasts;
    dialect.dual = "(select 'X' as dummy)";
    dialect.cuts_for_update = true;
    dialect.decode = &kDecode;
    dialect.subquery_alias = " as q";
    return dialect;
}

// What is refused as a statement and what is not: an engine's text has no placeholders beside the statement's own.
TEST(SqlText, SurvivesAnything) {
    constexpr std::string_view kPieces[] = {":a", ":b", "?", "::", ":", " ", " ", ",", "(", ")", "from ", "dual", "rowid", "=", "into ", "'x'", "returning ",
                                            "cast(", " as ", "decode(", "for update ", ";", "end", "open :c for ", "q'[", "/*", "--", "$1", "with ", "e+"};
    std::mt19937 random(5);
    for (int i = 0; i < 50000; ++i) {
        std::string text = i % 3 == 0 ? "begin " : "select ";
        for (unsigned n = random() % 12; n > 0; --n) text += kPieces[random() % std::size(kPieces)];
        const sql::StatementText statement = sql::Scan(text);
        for (const sql::Step& step : statement.error == 0 ? statement.steps : std::vector<sql::Step>())
            for (const std::uint32_t placeholder : sql::Rewrite(text, statement, step, TestDialect()).placeholders)
                EXPECT_LT(placeholder, statement.placeholders.size()) << text;
    }
}

// Deep nesting, quotes that never close, comments within comments, placeholders without end: all linear.
TEST(SqlText, HostileTextsTakeBoundedTime) {
    const auto repeat = [](std::string_view piece) {
        std::string text = "select ";
        while (text.size() < 500000) text += piece;
        return text;
    };
    const auto start = std::chrono::steady_clock::now();
    for (const char* piece : {"(", "cast(", "decode(", "from (select ", "'", "\"", "/*", "--\n", ":a ", "?", "rowid in (",
                              "with ", ";", "for update ", "q'", "q'[", "e+", "begin ", "into :x,", "rowid = "}) {
        const std::string text = repeat(piece);
        const sql::StatementText statement = sql::Scan(text);
        for (const sql::Step& step : statement.steps) sql::Rewrite(text, statement, step, TestDialect());
        const sql::StatementText block = sql::Scan("begin " + text);
        for (const sql::Step& step : block.steps) sql::Rewrite(text, block, step, TestDialect());
    }
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(30));
}

}  // namespace
