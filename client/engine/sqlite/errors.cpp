// Result codes and messages of SQLite: one table row a code or a beginning of a message.
#include "engine/sqlite/errors.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace engine::sqlite {
namespace {

constexpr int kNoRoom = 1653;

struct CodeRow {
    int code;      // extended or primary
    int number;
};

// An extended code has its row before the primary one.
constexpr CodeRow kCodes[] = {
    {SQLITE_CONSTRAINT_UNIQUE, 1},
    {SQLITE_CONSTRAINT_PRIMARYKEY, 1},
    {SQLITE_CONSTRAINT_ROWID, 1},
    {SQLITE_CONSTRAINT_CHECK, 2290},
    {SQLITE_CONSTRAINT_DATATYPE, 1722},
    {SQLITE_CONSTRAINT_TRIGGER, 20000},
    {SQLITE_CONSTRAINT, 2290},
    {SQLITE_BUSY_SNAPSHOT, 8177},
    {SQLITE_BUSY, 54},
    {SQLITE_LOCKED, 54},
    {SQLITE_PROTOCOL, 54},
    {SQLITE_NOMEM, 1019},
    {SQLITE_READONLY, 16000},
    {SQLITE_INTERRUPT, 1013},
    {SQLITE_IOERR, 1115},
    {SQLITE_CORRUPT, 1578},
    {SQLITE_NOTADB, 1210},
    {SQLITE_FULL, kNoRoom},
    {SQLITE_CANTOPEN, 12154},
    {SQLITE_PERM, 1031},
    {SQLITE_AUTH, 1031},
    {SQLITE_TOOBIG, 1489},
    {SQLITE_MISMATCH, 1722},
    {SQLITE_RANGE, 1036},
    {SQLITE_SCHEMA, 1466},
    {SQLITE_ABORT, 2091},
    {SQLITE_NOLFS, 1115},
};

// What SQLITE_ERROR means stands in its message alone.
struct WordsRow {
    std::string_view begin;       // how the message begins; empty: any
    std::string_view contains;
    int number;
};

constexpr WordsRow kWords[] = {
    {"no such table", "", 942},
    {"no such view", "", 942},
    {"unknown database", "", 942},
    {"no such column", "", 904},
    {"no such index", "", 1418},
    {"no such trigger", "", 4043},
    {"no such savepoint", "", 1086},
    {"no such function", "", 904},
    {"ambiguous column name", "", 918},
    {"duplicate column name", "", 957},
    {"wrong number of arguments", "", 909},
    {"misuse of aggregate", "", 934},
    {"misuse of window function", "", 934},
    {"incomplete input", "", 921},
    {"unrecognized token", "", 911},
    {"a GROUP BY clause is required", "", 937},
    {"aggregate functions are not allowed", "", 934},
    {"SELECTs to the left and right", "", 1789},
    {"all VALUES must have the same number", "", 1789},
    {"sub-select returns", "", 913},
    {"row value misused", "", 913},
    {"foreign key mismatch", "", 2270},
    {"not authorized", "", 1031},
    {"cannot modify", "", 1031},
    {"cannot commit", "", 54},
    {"", "already exists", 955},
    {"", "already another table or index", 955},
    {"", "may not be dropped", 1031},
    {"", "may not be modified", 1031},
    {"", "has no column named", 904},
    {"", "integer overflow", 1426},
    {"", "not unique", 1},
    {"", "may not be altered", 1031},
};

// "table t has 3 columns but 2 values were supplied", "2 values for 3 columns"
int CountMismatch(std::string_view message) {
    int columns = 0;
    int values = 0;
    const std::string text(message);
    const std::size_t has = text.rfind(" has ");
    if (has != std::string::npos &&
        std::sscanf(text.c_str() + has, " has %d columns but %d values", &columns, &values) == 2) {
        return values < columns ? 947 : 913;
    }
    const bool told = std::sscanf(text.c_str(), "%d values for %d columns", &values, &columns) == 2;
    return !told ? 0 : values < columns ? 947 : 913;
}

int NumberOfWords(std::string_view message) {
    for (const WordsRow& row : kWords) {
        if (message.starts_with(row.begin) && message.find(row.contains) != std::string_view::npos) return row.number;
    }
    const int mismatch = CountMismatch(message);
    return mismatch ? mismatch : 900;
}

int NumberOf(int code, Verb verb, std::string_view message) {
    if (code == SQLITE_CONSTRAINT_NOTNULL) return verb == Verb::update ? 1407 : 1400;
    if (code == SQLITE_CONSTRAINT_FOREIGNKEY) return verb == Verb::remove ? 2292 : 2291;
    for (const CodeRow& row : kCodes) {
        if (row.code == code || row.code == (code & 0xFF)) return row.number;
    }
    return (code & 0xFF) == SQLITE_ERROR ? NumberOfWords(message) : 600;
}

// A write that has just failed at the limit of the process or the quota of the user: SQLite knows the full disk only,
// and sqlite3_system_errno() does not tell of commits.
bool MayNotGrow(int code) { return code == SQLITE_IOERR_WRITE && (errno == EFBIG || errno == EDQUOT); }

// "number detail", from a function of our own.
Status ToldByFunction(std::string_view words) {
    const std::size_t blank = words.find(' ');
    return Error(std::atoi(std::string(words.substr(0, blank)).c_str()), std::string(words.substr(blank + 1)))
        .From("SQLITE");
}

}  // namespace

Status Failure(int code, std::string_view words) {
    return Error(NumberOf(code, Verb::other, words), std::string(words)).From("SQLITE");
}

Status Failure(sqlite3* database, int code, Verb verb) {
    const int extended = sqlite3_extended_errcode(database);
    const std::string_view words = sqlite3_errmsg(database);
    if (words.starts_with(kErrorMark)) return ToldByFunction(words.substr(kErrorMark.size()));
    const int told = (extended & 0xFF) == (code & 0xFF) ? extended : code;
    const int number = MayNotGrow(told) ? kNoRoom : NumberOf(told, verb, words);
    return Error(number, std::string(words)).From("SQLITE");
}

Status RolledBack(const Status& failure) {
    std::string detail = failure.Detail();
    if (!detail.empty()) detail += "; ";
    return Error(failure.Number(), detail + "the transaction was rolled back").From("SQLITE");
}

}  // namespace engine::sqlite
