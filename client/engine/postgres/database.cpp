// A PostgreSQL server that a server handle is attached to: its dialect, its sessions.
#include <memory>
#include <string>

#include "engine/postgres/binary.h"
#include "engine/postgres/connection.h"
#include "engine/postgres/home.h"
#include "engine/postgres/libpq.h"
#include "engine/postgres/postgres.h"
#include "engine/postgres/types.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

// Types that the server has others for. A date has a time here, and a whole number as many digits as any.
constexpr Dialect::Spelling kTypes[] = {
    {"number", "numeric"},
    {"varchar2", "varchar"},
    {"nvarchar2", "varchar"},
    {"nchar", "char"},
    {"binary_float", "real"},
    {"binary_double", "double precision"},
    {"integer", "numeric(38)"},
    {"int", "numeric(38)"},
    {"smallint", "numeric(38)"},
    {"decfloat", "numeric", true},
    {"float", "numeric", true},
    {"long raw", "kelp.long_raw"},
    {"long", "kelp.long"},
    {"raw", "kelp.raw", true},
    {"blob", "bytea"},
    {"clob", "text"},
    {"nclob", "kelp.nclob"},
    {"dbclob", "kelp.dbclob"},
    {"date", "kelp.date"},
    {"rowid", "tid"},
    {"timestamp with local time zone", "timestamptz"},
    {"timestamp with time zone", "timestamptz"},
    {"interval year to month", "kelp.year_month", true},
    {"interval day to second", "interval day to second"},    // without the digits of the days
};

// The moment of the statement; the server's own words mean that of the transaction.
constexpr Dialect::Spelling kFunctions[] = {
    {"sysdate", "kelp.sysdate()"},
    {"current_date", "kelp.\"current_date\"()"},
    {"systimestamp", "kelp.systimestamp()"},
    {"current_timestamp", "kelp.\"current_timestamp\"()"},
    {"localtimestamp", "kelp.\"localtimestamp\"()"},
};

constexpr Dialect::Spelling kCalls[] = {
    {"nvl", "coalesce"},
    {"greatest", "kelp.greatest_of"},
    {"least", "kelp.least_of"},
};

// A value is asked for once; two nulls are the same.
constexpr Dialect::DecodeText kDecode = {
    "(with kelp_d(kelp_e) as (select ", ") select case when kelp_d.kelp_e is not distinct from ", " then ",
    " when kelp_d.kelp_e is not distinct from ", " else ", " end from kelp_d)"};

std::string Placeholder(std::size_t number) { return '$' + std::to_string(number); }

std::string DateLiteral(const date::DateTime& value, bool is_date) {
    char text[date::kMaxEngineText];
    const std::string written(text, date::ToEngineText(value, text));
    return (is_date ? "kelp.date '" : value.has_zone ? "timestamptz '" : "timestamp(6) '") + written + "'";
}

std::string RowIdLiteral(const RowId& row) {
    char bytes[kTupleIdSize];
    TupleIdOf(row, bytes);
    return "'(" + std::to_string(Get<std::uint32_t>(bytes)) + "," + std::to_string(Get<std::uint16_t>(bytes + 4)) + ")'::tid";
}

// The application's names are in upper case where the server's are in lower case: in quotes each is the other's.
std::string QuotedName(std::string_view quoted) { return ShownName(quoted); }

std::string BytesLiteral(std::string_view digits) { return "'\\x" + std::string(digits) + "'::bytea"; }

class PgDatabase final : public Database {
public:
    explicit PgDatabase(std::shared_ptr<Home> home) : home_(std::move(home)) {}

    [[nodiscard]] const Dialect& GetDialect() const override;
    [[nodiscard]] const Capabilities& GetCapabilities() const override;
    std::string Version() override { return home_->Version(); }
    [[nodiscard]] std::string Identity() const override { return home_->Where(); }
    Status Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                   std::unique_ptr<Connection>& connection) override;

private:
    const std::shared_ptr<Home> home_;
};

const Dialect& PgDatabase::GetDialect() const {
    static constexpr Dialect kDialect{
        .placeholder = Placeholder,
        .types = kTypes,
        .functions = kFunctions,
        .calls = kCalls,
        .casts = {},
        .counts_characters = {},
        .dual = "(select 'X' as dummy)",
        .minus = "except",
        .truncate_table = {},
        .date_literal = DateLiteral,
        .row_id_literal = RowIdLiteral,
        .row_id = "ctid",
        .subquery_alias = " as kelp_q",
        .quoted_name = QuotedName,
        .bytes_literal = BytesLiteral,
        .empty_text = "null",
        .decode = &kDecode,
    };
    return kDialect;
}

// Whether transactions can be prepared is a setting of the server's.
const Capabilities& PgDatabase::GetCapabilities() const {
    static constexpr Capabilities kOnePhase{
        .lobs = true, .sequences = true, .typed_parameters = true, .statement_waits = true};
    static constexpr Capabilities kTwoPhase{
        .two_phase = true, .lobs = true, .sequences = true, .typed_parameters = true, .statement_waits = true};
    return home_->TwoPhase() ? kTwoPhase : kOnePhase;
}

Status PgDatabase::Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                           std::unique_ptr<Connection>& connection) {
    std::unique_ptr<Wire> wire;
    Status status = home_->Connect(credentials, std::move(stop), wire);
    if (status.Ok()) connection = std::make_unique<PgConnection>(home_, credentials, std::move(wire));
    return status;
}

}  // namespace

Status PgConnection::Another(std::shared_ptr<const StopRequest> stop, std::unique_ptr<Connection>& connection) {
    std::unique_ptr<class Wire> wire;
    Status status = home_->Connect(credentials_, std::move(stop), wire);
    if (status.Ok()) connection = std::make_unique<PgConnection>(home_, credentials_, std::move(wire));
    return status;
}

Status Open(const std::string& url, std::unique_ptr<Database>& database) {
    if (Status status = LoadLibpq(); !status.Ok()) return status;
    auto home = std::make_shared<Home>(url);
    Status status = home->Attach();
    if (status.Ok()) database = std::make_unique<PgDatabase>(std::move(home));
    return status;
}

}  // namespace engine::postgres
