// SQLSTATEs and what libpq says of connections: one table row a state, or a beginning of one.
#include "engine/postgres/errors.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <new>
#include <string>

#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr const char* kEngine = "POSTGRESQL";

struct StateRow {
    std::string_view state;       // or its beginning: the class
    std::string_view contains;    // of the message; empty: any
    int number;
};

// The first row that fits counts: words before the state alone, states before their class.
constexpr StateRow kStates[] = {
    {"02000", "", errors::kNoRows},
    {"08", "", errors::kEndOfChannel},
    {"0A000", "cached plan", errors::kSchemaChanged},
    {"0A000", "", errors::kUnsupported},
    {"21000", "", 1427},
    {"22001", "", errors::kTooLarge},
    {"22003", "field overflow", errors::kAbovePrecision},
    {"22003", "", errors::kNumericOverflow},
    {"22004", "", errors::kNullFetched},
    {"22007", "", errors::kTextMismatch},
    {"22008", "", errors::kBadDayForMonth},
    {"22009", "", errors::kNoZone},
    {"22012", "", 1476},
    {"22021", "", errors::kInvalidCharacter},
    {"22P02", "bytea", errors::kBadHexadecimal},
    {"22P02", "hexadecimal", errors::kBadHexadecimal},
    {"22P02", "type tid", errors::kInvalidRowId},
    {"22P02", "", errors::kInvalidNumber},
    {"22018", "", errors::kInvalidNumber},
    {"22023", "hexadecimal", errors::kBadHexadecimal},
    {"22023", "time zone", errors::kNoSuchZone},
    {"22", "", errors::kOutOfRange},
    {"23001", "", errors::kChildFound},
    {"23502", "", errors::kNullInserted},
    {"23503", "update or delete", errors::kChildFound},
    {"23503", "", errors::kParentMissing},
    {"23505", "", 1},
    {"23514", "", errors::kCheckViolated},
    {"23P01", "", 1},
    {"23", "", errors::kCheckViolated},
    {"24000", "", 1001},
    {"25006", "", errors::kReadOnlyTransaction},
    {"25P02", "", errors::kRolledBack},
    {"26000", "", 1003},
    {"28", "", errors::kBadLogon},
    {"2BP01", "", 2303},
    {"34000", "", 1001},
    {"3B001", "", errors::kNoSuchSavepoint},
    {"3D000", "", 12514},
    {"3F000", "", errors::kNoSuchObject},
    {"40001", "", errors::kCannotSerialise},
    {"40P01", "", 60},
    {"40", "", errors::kRolledBack},
    {"42501", "", errors::kInsufficientPrivileges},
    {"42601", "end of input", errors::kUnexpectedEnd},
    {"42601", "more expressions than target columns", errors::kTooManyValues},
    {"42601", "more target columns than expressions", errors::kTooFewValues},
    {"42601", "same number of columns", errors::kColumnCountsDiffer},
    {"42601", "must return only one column", errors::kTooManyValues},
    {"42601", "multiple commands", errors::kNotProperlyEnded},
    {"42601", "unterminated quoted", errors::kUnclosedText},
    {"42601", "", errors::kInvalidStatement},
    {"42602", "", 931},
    {"42611", "", 902},
    {"42622", "", 972},
    {"42701", "", errors::kDuplicateColumn},
    {"42702", "", errors::kAmbiguousColumn},
    {"42703", "", errors::kInvalidIdentifier},
    {"42704", "index", errors::kNoSuchIndex},
    {"42704", "type", 902},
    {"42704", "role", 1435},
    {"42704", "", errors::kNoSuchObject},
    {"42710", "", errors::kNameInUse},
    {"42712", "", errors::kAmbiguousColumn},
    {"42723", "", errors::kNameInUse},
    {"42725", "", errors::kInconsistentTypes},
    {"42803", "are not allowed", errors::kAggregateNotAllowed},
    {"42803", "", errors::kNotSingleGroup},
    {"42804", "", errors::kInconsistentTypes},
    {"42809", "", errors::kNoSuchTable},
    {"42830", "", errors::kKeyCountsDiffer},
    {"42846", "", errors::kInconsistentTypes},
    {"42883", "operator", errors::kInconsistentTypes},
    {"42883", "", errors::kInvalidIdentifier},
    {"42P01", "sequence", 2289},
    {"42P01", "", errors::kNoSuchTable},
    {"42P02", "", errors::kNotAllBound},
    {"42P03", "", errors::kNameInUse},
    {"42P06", "", errors::kNameInUse},
    {"42P07", "", errors::kNameInUse},
    {"42P08", "", errors::kInconsistentTypes},
    {"42P18", "", errors::kInconsistentTypes},
    {"42", "", errors::kInvalidStatement},
    {"44000", "", 1402},
    {"53100", "", errors::kNoRoom},
    {"53200", "", 4031},
    {"53300", "", 18},
    {"54", "", errors::kStatementTooLong},
    {"55P03", "", errors::kResourceBusy},
    {"57014", "", errors::kCancelled},
    {"57P01", "", errors::kEndOfChannel},
    {"57P02", "", errors::kEndOfChannel},
    {"57P03", "", 1033},
    {"57P05", "", errors::kEndOfChannel},
    {"58", "", errors::kInputOutputError},
    {"P0001", "", 20000},
    {"P0002", "", errors::kNoRows},
    {"P0003", "", errors::kTooManyRows},
    {"XX001", "", errors::kCorruptFile},
    {"XX002", "", errors::kCorruptFile},
};

int NumberOf(std::string_view state, std::string_view message, Verb verb) {
    if (state == "23502" && verb == Verb::update) return errors::kNullUpdated;
    const bool stores = verb == Verb::insert || verb == Verb::update;
    const bool is_real = message.ends_with("type real") || message.ends_with("type double precision");
    if (state == "22003" && stores && !is_real) return errors::kAbovePrecision;
    for (const StateRow& row : kStates) {
        if (state.starts_with(row.state) && message.find(row.contains) != std::string_view::npos) return row.number;
    }
    return errors::kInternalError;
}

std::string_view Field(const PGresult* result, int field) {
    const char* text = PQresultErrorField(result, field);
    return text ? text : "";
}

std::string_view Trimmed(std::string_view text) {
    while (text.ends_with('\n')) text.remove_suffix(1);
    return text;
}

// What libpq says when a connection cannot be made, and what the system says of sockets.
struct ConnectRow {
    int system;               // an errno whose words are looked for; 0: `words` are
    const char* words;
    int number;
};
constexpr ConnectRow kConnects[] = {
    {ECONNREFUSED, nullptr, 12541},
    {ENOENT, nullptr, 12541},
    {EACCES, nullptr, 12541},
    {ETIMEDOUT, nullptr, 12170},
    {EHOSTUNREACH, nullptr, 12543},
    {ENETUNREACH, nullptr, 12543},
    {ECONNRESET, nullptr, 12547},
    {0, "timeout expired", 12170},
    {0, "could not translate host name", errors::kNoDatabase},
    {0, "no password supplied", errors::kBadLogon},
    {0, "server closed the connection", 12547},
    {0, "SSL", 12560},
};

// The five characters behind "FATAL:  ", as libpq shows them when it is told to be verbose.
std::string_view StateIn(std::string_view message) {
    const std::size_t colon = message.rfind("FATAL:  ");
    if (colon == std::string_view::npos) return {};
    const std::string_view rest = message.substr(colon + 8);
    return rest.size() > 6 && rest[5] == ':' ? rest.substr(0, 5) : std::string_view();
}

}  // namespace

Status Refused(int number, std::string_view words) noexcept {
    try {
        return Error(number, std::string(words)).From(kEngine);
    } catch (const std::bad_alloc&) {
        return Error(number).From(kEngine);
    }
}

Status Failure(const PGresult* result, Verb verb) noexcept {
    const std::string_view words = Field(result, PG_DIAG_MESSAGE_PRIMARY);
    if (words.empty()) return Refused(errors::kOutOfMemory, Trimmed(PQresultErrorMessage(result)));
    if (words.starts_with(kErrorMark)) {
        const std::string_view told = words.substr(kErrorMark.size());
        const std::size_t blank = told.find(' ');
        const int number = std::atoi(told.data());
        if (number > 0) return Refused(number, blank == std::string_view::npos ? "" : told.substr(blank + 1));
    }
    return Refused(NumberOf(Field(result, PG_DIAG_SQLSTATE), words, verb), words);
}

Status ConnectFailure(std::string_view message) noexcept {
    const std::string_view state = StateIn(message);
    if (!state.empty()) {
        const std::string_view words = message.substr(message.rfind("FATAL:  ") + 15);
        return Refused(NumberOf(state, words, Verb::other), words.substr(0, words.find('\n')));
    }
    for (const ConnectRow& row : kConnects) {
        const char* words = row.system ? std::strerror(row.system) : row.words;
        if (message.find(words) != std::string_view::npos) return Refused(row.number, Trimmed(message));
    }
    return Refused(12560, Trimmed(message));
}

bool IsPassing(const Status& failure) noexcept {
    static constexpr int kPassing[] = {18, 60, 4031, errors::kOutOfMemory, errors::kCancelled, errors::kNoRoom, errors::kResourceBusy,
                                       errors::kCannotSerialise, errors::kRolledBack, errors::kInputOutputError};
    return std::find(std::begin(kPassing), std::end(kPassing), failure.Number()) != std::end(kPassing);
}

Status RolledBack(const Status& failure) noexcept try {
    constexpr std::string_view kLost = "the transaction was rolled back";
    std::string detail = failure.Detail();
    if (detail.ends_with(kLost)) return failure;
    if (!detail.empty()) detail += "; ";
    return Error(failure.Number(), detail.append(kLost)).From(kEngine);
} catch (const std::bad_alloc&) {
    return Error(failure.Number()).From(kEngine);
}

}  // namespace engine::postgres
