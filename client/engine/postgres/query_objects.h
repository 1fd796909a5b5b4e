// What stands for a new large object of the server in a statement.
#pragma once

#include <string>

namespace engine::postgres {

// `bytes` is an expression of the server's.
inline std::string NewObject(const std::string& bytes) { return "pg_catalog.lo_from_bytea(0, " + bytes + ")"; }

}  // namespace engine::postgres
