// The PostgreSQL engine: what it shows of itself.
#pragma once

#include <memory>
#include <string>

#include "engine/engine.h"

namespace engine::postgres {

// Attaches the server that a postgresql:// URL names: 12154 for no URL, 12541 where nobody listens, 12170 after the
// connect_timeout of the URL, 12560 where libpq cannot be loaded, which is done here.
Status Open(const std::string& url, std::unique_ptr<Database>& database);

}  // namespace engine::postgres
