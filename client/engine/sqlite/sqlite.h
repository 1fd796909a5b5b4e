// The embedded engine.
#pragma once

#include <memory>
#include <string>

#include "engine/engine.h"

namespace engine::sqlite {

// Opens a database file, made when missing, or ":memory:".
Status Open(const std::string& file, std::unique_ptr<Database>& database);

}  // namespace engine::sqlite
