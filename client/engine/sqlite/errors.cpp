// Result codes and messages of SQLite: one table row a code or a beginning of a message.
#include "engine/sqlite/errors.h"

#include "handles/errors.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <new>
#include <string>

namespace engine::sqlite {
namespace {

struct CodeRow {
    int code;      // extended or primary
    int number;
};

// An extended code has its row before the primary one.
constexpr CodeRow kCodes[] = {
    {SQLITE_CONSTRAINT_UNIQUE, 1},
    {SQLITE_CONSTRAINT_PRIMARYKEY, 1},
    {SQLITE_CONSTRAINT_ROWID, 1},
    {SQLITE_CONSTRAINT_CHECK, errors::kCheckViolated},
    {SQLITE_CONSTRAINT_DATATYPE, errors::kInvalidNumber},
    {SQLITE_CONSTRAINT_TRIGGER, 20000},
    {SQLITE_CONSTRAINT, errors::kCheckViolated},
    {SQLITE_BUSY_SNAPSHOT, 8177},
    {SQLITE_BUSY, 54},
    {SQLITE_LOCKED, 54},
    {SQLITE_PROTOCOL, 54},
    {SQLITE_NOMEM, errors::kOutOfMemory},
    {SQLITE_READONLY, 16000},
    {SQLITE_INTERRUPT, errors::kCancelled},
    {SQLITE_IOERR, errors::kInputOutputError},
    {SQLITE_CORRUPT, errors::kCorruptFile},
    {SQLITE_NOTADB, errors::kNoDatabaseFile},
    {SQLITE_FULL, errors::kNoRoom},
    {SQLITE_CANTOPEN, 12154},
    {SQLITE_PERM, errors::kInsufficientPrivileges},
    {SQLITE_AUTH, errors::kInsufficientPrivileges},
    {SQLITE_TOOBIG, errors::kStatementTooLong},
    {SQLITE_MISMATCH, errors::kInvalidNumber},
    {SQLITE_RANGE, errors::kNoSuchBind},
    {SQLITE_SCHEMA, errors::kSchemaChanged},
    {SQLITE_ABORT, errors::kRolledBack},
    {SQLITE_NOLFS, errors::kInputOutputError},
};

// What SQLITE_ERROR means stands in its message alone.
struct WordsRow {
    std::string_view begin;       // how the message begins; empty: any
    std::string_view contains;
    int number;
};

constexpr WordsRow kWords[] = {
    {"no such table", "", errors::kNoSuchTable},
    {"no such view", "", errors::kNoSuchTable},
    {"unknown database", "", errors::kNoSuchTable},
    {"no such column", "", errors::kInvalidIdentifier},
    {"no such index", "", errors::kNoSuchIndex},
    {"no such trigger", "", 4043},
    {"no such savepoint", "", errors::kNoSuchSavepoint},
    {"no such function", "", errors::kInvalidIdentifier},
    {"ambiguous column name", "", errors::kAmbiguousColumn},
    {"duplicate column name", "", errors::kDuplicateColumn},
    {"wrong number of arguments", "", errors::kWrongArgumentCount},
    {"misuse of aggregate", "", errors::kAggregateNotAllowed},
    {"misuse of window function", "", errors::kAggregateNotAllowed},
    {"incomplete input", "", errors::kUnexpectedEnd},
    {"unrecognized token", "", errors::kInvalidCharacter},
    {"a GROUP BY clause is required", "", errors::kNotSingleGroup},
    {"aggregate functions are not allowed", "", errors::kAggregateNotAllowed},
    {"SELECTs to the left and right", "", errors::kColumnCountsDiffer},
    {"all VALUES must have the same number", "", errors::kColumnCountsDiffer},
    {"sub-select returns", "", errors::kTooManyValues},
    {"row value misused", "", errors::kTooManyValues},
    {"foreign key mismatch", "", errors::kKeyCountsDiffer},
    {"not authorized", "", errors::kInsufficientPrivileges},
    {"cannot modify", "", errors::kInsufficientPrivileges},
    {"cannot commit", "", 54},
    {"use DROP ", "", errors::kNoSuchTable},    // of another kind
    {"cannot join using column", "", errors::kInvalidIdentifier},
    {"there is already a", "", errors::kNameInUse},
    {"", "already exists", errors::kNameInUse},
    {"", "may not be dropped", errors::kInsufficientPrivileges},
    {"", "may not be modified", errors::kInsufficientPrivileges},
    {"", "has no column named", errors::kInvalidIdentifier},
    {"", "integer overflow", errors::kNumericOverflow},
    {"", "not unique", 1},
    {"", "may not be altered", errors::kInsufficientPrivileges},
};

// "table t has 3 columns but 2 values were supplied", "2 values for 3 columns"; a message ends in a zero
int CountMismatch(std::string_view message) {
    int columns = 0;
    int values = 0;
    const std::size_t has = message.rfind(" has ");
    const bool told = (has != std::string_view::npos &&
                       std::sscanf(message.data() + has, " has %d columns but %d values", &columns, &values) == 2) ||
                      std::sscanf(message.data(), "%d values for %d columns", &values, &columns) == 2;
    return !told ? 0 : values < columns ? errors::kTooFewValues : errors::kTooManyValues;
}

int NumberOfWords(std::string_view message) {
    for (const WordsRow& row : kWords) {
        if (message.starts_with(row.begin) && message.find(row.contains) != std::string_view::npos) return row.number;
    }
    const int mismatch = CountMismatch(message);
    return mismatch ? mismatch : errors::kInvalidStatement;
}

int NumberOf(int code, Verb verb, std::string_view message) {
    if (code == SQLITE_CONSTRAINT_NOTNULL) return verb == Verb::update ? errors::kNullUpdated : errors::kNullInserted;
    if (code == SQLITE_CONSTRAINT_FOREIGNKEY)
        return verb == Verb::remove ? errors::kChildFound : errors::kParentMissing;
    for (const CodeRow& row : kCodes) {
        if (row.code == code || row.code == (code & 0xFF)) return row.number;
    }
    return (code & 0xFF) == SQLITE_ERROR ? NumberOfWords(message) : errors::kInternalError;
}

// A write that has just failed at the limit of the process or the quota of the user: SQLite knows the full disk only,
// and sqlite3_system_errno() does not tell of commits.
// Callers empty errno before the call.
bool MayNotGrow(int code) { return code == SQLITE_IOERR_WRITE && (errno == EFBIG || errno == EDQUOT); }

Status Told(int number, std::string_view words) noexcept {
    try {
        return Error(number, std::string(words)).From("SQLITE");
    } catch (const std::bad_alloc&) {
        return Error(number).From("SQLITE");
    }
}

// "number detail", from a function of our own.
Status ToldByFunction(std::string_view words) {
    const std::size_t blank = words.find(' ');
    return Told(std::atoi(words.data()), words.substr(blank + 1));
}

// Made while there is memory.
const Status kTransactionLost =
    Error(errors::kOutOfMemory, "out of memory; the transaction was rolled back").From("SQLITE");

}  // namespace

Status Failure(int code, std::string_view words) noexcept { return Told(NumberOf(code, Verb::other, words), words); }

Status Failure(sqlite3* database, int code, Verb verb) noexcept {
    const std::string_view words = sqlite3_errmsg(database);
    if ((code & 0xFF) == SQLITE_ERROR && words.starts_with(kErrorMark)) return ToldByFunction(words.substr(kErrorMark.size()));
    const int number = MayNotGrow(code) ? errors::kNoRoom : NumberOf(code, verb, words);
    return Told(number, words);
}

int SqlNumber(int failure) noexcept {
    switch (failure) {
        case errors::kBadNumberFormat: return errors::kBadNumberModel;
        case errors::kBadNumberText:
        case errors::kBadNumber: return errors::kInvalidNumber;
        case errors::kNumberUnderflow:
        case errors::kNumberOverflow: return errors::kNumericOverflow;
        default: return failure;
    }
}

Status RolledBack(const Status& failure) noexcept try {
    constexpr std::string_view kLost = "the transaction was rolled back";
    std::string detail = failure.Detail();
    if (detail.ends_with(kLost)) return failure;
    if (!detail.empty()) detail += "; ";
    return Error(failure.Number(), detail.append(kLost)).From("SQLITE");
} catch (const std::bad_alloc&) {
    return kTransactionLost;
}

}  // namespace engine::sqlite
