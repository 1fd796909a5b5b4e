// Accounts of an embedded database: a table of it, with passwords hashed by the system's crypt. The first named logon
// of a database without accounts makes its owner's.
#pragma once

#include <string>

#include "engine/engine.h"

namespace engine::sqlite {

class SqliteConnection;

inline constexpr const char* kAccounts = "kelp_accounts";    // the table
inline constexpr const char* kPasswords = "password";        // its column of hashes

Status Authenticate(SqliteConnection& connection, const Credentials& credentials);
Status ChangePassword(SqliteConnection& connection, const std::string& user, const std::string& old_password,
                      const std::string& new_password);

}  // namespace engine::sqlite
