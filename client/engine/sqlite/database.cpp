// A SQLite database that a server handle is attached to.
#include <memory>
#include <string>

#include "engine/sqlite/accounts.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/home.h"
#include "engine/sqlite/row_number.h"
#include "engine/sqlite/sqlite.h"

namespace engine::sqlite {
namespace {

// The release of the call interface that answers look like; programs read it to know what a server can do.
constexpr const char* kRelease = "23.1";

// Words that SQLite has others for. What it keeps as it is written stays: it remembers the declared words of a column.
constexpr Dialect::Spelling kTypes[] = {
    {"decfloat", "kelp_decfp"},    // without "floa", which would make every value a real
    {"string", "varchar"},    // SQLite would keep numbers that are written in one as numbers
    {"long raw", "long raw"},
    {"long", "long varchar"},
    {"timestamp with local time zone", "timestamp_ltz"},
    {"timestamp with time zone", "timestamp_tz"},
    {"interval year to month", "span_ym", false, "2"},
    {"interval day to second", "span_ds", false, "2,6"},
};

std::string Placeholder(std::size_t number) { return '?' + std::to_string(number); }

// The text in which dates are kept.
std::string DateLiteral(const date::DateTime& value, bool) {
    char text[date::kMaxEngineText];
    return "'" + std::string(text, date::ToEngineText(value, text)) + "'";
}

std::string RowIdLiteral(const RowId& row) { return std::to_string(RowNumber(row)); }

class SqliteDatabase final : public Database {
public:
    explicit SqliteDatabase(std::shared_ptr<Home> home) : home_(std::move(home)) {}
    ~SqliteDatabase() override { home_->Close(); }
    SqliteDatabase(const SqliteDatabase&) = delete;
    SqliteDatabase& operator=(const SqliteDatabase&) = delete;

    [[nodiscard]] const Dialect& GetDialect() const override;
    [[nodiscard]] const Capabilities& GetCapabilities() const override {
        static constexpr Capabilities kAble{.lobs = true};
        return kAble;
    }
    std::string Version() override;
    [[nodiscard]] std::string Identity() const override { return home_->Private() ? "" : home_->File(); }
    Status Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                   std::unique_ptr<Connection>& connection) override;

private:
    const std::shared_ptr<Home> home_;
};

const Dialect& SqliteDatabase::GetDialect() const {
    static constexpr Dialect kDialect{
        .placeholder = Placeholder,
        .types = kTypes,
        .functions = kMoments,
        .casts = kCasts,
        .counts_characters = kCountsCharacters,
        .dual = kDual,
        .minus = "except",
        .truncate_table = "delete from",
        .cuts_for_update = true,
        .date_literal = DateLiteral,
        .row_id_literal = RowIdLiteral,
    };
    return kDialect;
}

std::string SqliteDatabase::Version() {
    std::string text = std::string(kRelease) + " KELP embedded engine, SQLite " + sqlite3_libversion() + "\nDatabase ";
    return text += home_->Private() ? "in memory" : home_->File();
}

Status SqliteDatabase::Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                               std::unique_ptr<Connection>& connection) {
    const std::unique_lock door = home_->Door();
    std::unique_ptr<SqliteConnection> made;
    Status status = SqliteConnection::Make(home_, std::move(stop), made);
    if (status.Ok()) status = Authenticate(*made, credentials);
    if (status.Ok()) connection = std::move(made);
    return status;
}

}  // namespace

Status Open(const std::string& file, std::unique_ptr<Database>& database) {
    auto home = std::make_shared<Home>(file);
    Status status = home->Open();
    if (status.Ok()) database = std::make_unique<SqliteDatabase>(std::move(home));
    return status;
}

}  // namespace engine::sqlite
