// Which database a name stands for, and which engine opens it.
#include <array>
#include <cstdlib>
#include <string>

#include "engine/engine.h"
#include "engine/postgres/postgres.h"
#include "engine/sqlite/sqlite.h"
#include "platform/ini.h"

namespace engine {
namespace {

constexpr const char* kDefaultName = "kelp";

// The directory of kelpcli.ini and of the databases that a plain word names.
std::string Home() {
    const char* home = std::getenv("KELPCI_HOME");
    return home && *home ? home : ".";
}

bool IsUrl(std::string_view database) {
    return database.starts_with("postgresql://") || database.starts_with("postgres://");
}

// What the section of that name in kelpcli.ini says to be its url; empty when there is none.
std::string UrlOf(std::string_view database) {
    std::array<char, 4096> url;
    IniReadString("kelpcli.ini", std::string(database).c_str(), "url", "", url.data(), url.size());
    return url.data();
}

std::string FileOf(std::string_view database) {
    if (database == ":memory:" || database.find('/') != std::string_view::npos || database.ends_with(".db")) {
        return std::string(database);
    }
    return Home() + '/' + std::string(database) + ".db";
}

}  // namespace

Status Open(std::string_view name, std::unique_ptr<Database>& database) {
    if (name.empty()) name = kDefaultName;
    const std::string url = IsUrl(name) ? std::string(name) : UrlOf(name);
    if (!url.empty()) return postgres::Open(url, database);
    return sqlite::Open(FileOf(name), database);
}

}  // namespace engine
