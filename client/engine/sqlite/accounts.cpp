// Accounts: the table, hashing, and the first logon that makes an owner.
#include "engine/sqlite/accounts.h"

#include <crypt.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cctype>
#include <cstring>
#include <memory>

#include "engine/sqlite/connection.h"
#include "engine/sqlite/errors.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

constexpr const char* kHashMethod = "$y$";    // yescrypt

constexpr const char* kCreate =
    "create table if not exists main.kelp_accounts(name text primary key, password text not null, "
    "created text not null default current_timestamp)";

// User names are the same in either letter case.
std::string Folded(const std::string& name) {
    std::string folded = name;
    for (char& c : folded) c = static_cast<char>(c >= 'a' && c <= 'z' ? c - 'a' + 'A' : c);
    return folded;
}

// The password's hash in the way that `setting` tells (a former hash or a fresh setting); empty when that fails.
std::string Hash(const std::string& password, const char* setting) {
    const auto work = std::make_unique<crypt_data>();    // some 32 KB
    // Not crypt_r: the address sanitizer's own of that name needs the program itself to be linked with the real one.
    const char* hash = crypt_rn(password.c_str(), setting, work.get(), sizeof *work);
    return hash ? hash : "";
}

std::string NewHash(const std::string& password) {
    char setting[CRYPT_GENSALT_OUTPUT_SIZE];
    if (!crypt_gensalt_rn(kHashMethod, 0, nullptr, 0, setting, sizeof setting)) return {};
    return Hash(password, setting);
}

// A hash holds no zero byte, and what follows one in a password would not count.
bool Usable(const std::string& text) { return text.find('\0') == std::string::npos; }

bool Matches(const std::string& password, const std::string& hash) {
    return Usable(password) && Hash(password, hash.c_str()) == hash;
}

// Runs a statement with texts bound; `answer` takes the first column of the first row, if there is one. The table is
// the database's own: a temporary one of that name would come before it.
Status Run(SqliteConnection& connection, const char* sql, std::initializer_list<std::string_view> texts,
           std::string* answer, bool* found) {
    const SqliteConnection::Trusted trusted(connection);
    sqlite3* database = connection.Database();
    sqlite3_stmt* compiled = nullptr;
    int code = sqlite3_prepare_v2(database, sql, -1, &compiled, nullptr);
    const StatementHandle statement(compiled);
    if (code != SQLITE_OK) return Failure(database, code);
    int index = 0;
    for (const std::string_view text : texts) {
        code = sqlite3_bind_text(compiled, ++index, text.data(), static_cast<int>(text.size()), SQLITE_TRANSIENT);
        if (code != SQLITE_OK) return Failure(database, code);
    }
    code = sqlite3_step(compiled);
    if (code != SQLITE_ROW && code != SQLITE_DONE) return connection.Failed(code, Verb::other, false);
    if (found) *found = code == SQLITE_ROW;
    const auto* text = code == SQLITE_ROW ? sqlite3_column_text(compiled, 0) : nullptr;
    if (answer && text) *answer = reinterpret_cast<const char*>(text);
    return {};
}

Status HasAccounts(SqliteConnection& connection, bool& has) {
    Status status =
        Run(connection, "select name from main.sqlite_schema where name = 'kelp_accounts'", {}, nullptr, &has);
    return status.Ok() && has ? Run(connection, "select name from main.kelp_accounts limit 1", {}, nullptr, &has)
                              : status;
}

Status FindHash(SqliteConnection& connection, const std::string& user, std::string& hash, bool& found) {
    return Run(connection, "select password from main.kelp_accounts where name = ?1", {Folded(user)}, &hash, &found);
}

bool OwnsFile(SqliteConnection& connection) {
    struct stat file{};
    return !connection.Private() && stat(connection.File().c_str(), &file) == 0 &&
           file.st_uid == geteuid();
}

// Two first logons at a time: the transaction lets one be the owner, the other is then checked like any.
Status TakeOwnership(SqliteConnection& connection, const Credentials& credentials, bool& taken) {
    Status status = connection.Begin(TransactionMode::read_write);
    bool has_accounts = false;
    if (status.Ok()) status = Run(connection, kCreate, {}, nullptr, nullptr);
    if (status.Ok()) status = HasAccounts(connection, has_accounts);
    if (status.Ok() && !has_accounts) {
        const std::string hash = NewHash(credentials.password);
        status = hash.empty() ? Error(errors::kBadLogon)
                              : Run(connection, "insert into main.kelp_accounts(name, password) values(?1, ?2)",
                                    {Folded(credentials.user), hash}, nullptr, nullptr);
        taken = status.Ok();
    }
    if (status.Ok()) status = connection.Commit();
    if (status.Ok()) return status;
    (void)connection.Rollback();    // the first error counts
    return status;
}

}  // namespace

Status Authenticate(SqliteConnection& connection, const Credentials& credentials) {
    bool has_accounts = false;
    Status status = HasAccounts(connection, has_accounts);
    if (status.Failed()) return status;
    if (credentials.external) return !has_accounts || OwnsFile(connection) ? Status() : Error(errors::kBadLogon);
    if (!Usable(credentials.user) || !Usable(credentials.password)) return Error(errors::kBadLogon);
    if (!has_accounts) {
        bool taken = false;
        status = TakeOwnership(connection, credentials, taken);
        if (status.Failed() || taken) return status;
    }
    std::string hash;
    bool found = false;
    status = FindHash(connection, credentials.user, hash, found);
    if (status.Failed()) return status;
    return found && Matches(credentials.password, hash) ? Status() : Error(errors::kBadLogon);
}

Status ChangePassword(SqliteConnection& connection, const std::string& user, const std::string& old_password,
                      const std::string& new_password) {
    if (connection.InTransaction()) return Error(errors::kTransactionActive);    // a rollback would undo the change
    bool found = false;
    Status status = HasAccounts(connection, found);
    std::string hash;
    if (status.Ok() && found) status = FindHash(connection, user, hash, found);
    if (status.Failed()) return status;
    if (!found) return Error(errors::kBadLogon);
    if (!Matches(old_password, hash)) return Error(errors::kBadOldPassword);
    const std::string new_hash = Usable(new_password) ? NewHash(new_password) : std::string();
    if (new_hash.empty()) return Error(errors::kBadLogon);
    (void)connection.ReadAhead();
    return Run(connection, "update main.kelp_accounts set password = ?2 where name = ?1", {Folded(user), new_hash},
               nullptr, nullptr);
}

}  // namespace engine::sqlite
