// Two-phase commit: prepared transactions of the server. They outlive the process; any connection to the database
// finishes them.
#include <charconv>
#include <string>

#include "engine/postgres/lob_store.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::string_view kPrefix = "kelp.";
constexpr std::string_view kDigits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-_";

// Base 64 of 2 * 64 bytes fits the server's names of 199 characters, which hexadecimal digits do not.
void Encode(std::string_view bytes, std::string& text) {
    unsigned held = 0, bits = 0;
    for (const char c : bytes) {
        held = held << 8 | static_cast<unsigned char>(c);
        for (bits += 8; bits >= 6; bits -= 6) text += kDigits[held >> (bits - 6) & 63];
    }
    if (bits > 0) text += kDigits[held << (6 - bits) & 63];
}

// False for what is no such text, or longer than a part of a name.
bool Decode(std::string_view text, std::string& bytes) {
    unsigned held = 0, bits = 0;
    for (const char c : text) {
        const std::size_t digit = kDigits.find(c);
        if (digit == std::string_view::npos) return false;
        held = held << 6 | static_cast<unsigned>(digit);
        bits += 6;
        if (bits < 8) continue;
        bits -= 8;
        bytes += static_cast<char>(held >> bits & 0xFF);
    }
    return bytes.size() <= 64;
}

// kelp.FORMAT.GLOBAL.BRANCH
std::string NameOf(const Xid& xid) {
    const std::string_view data(xid.data.data(), xid.Length());
    std::string name(kPrefix);
    name += std::to_string(xid.format) + '.';
    Encode(data.substr(0, xid.global_length), name);
    name += '.';
    Encode(data.substr(xid.global_length), name);
    return name;
}

bool ReadName(std::string_view name, Xid& xid) {
    if (!name.starts_with(kPrefix)) return false;
    name.remove_prefix(kPrefix.size());
    const std::size_t first = name.find('.');
    const std::size_t second = first == std::string_view::npos ? first : name.find('.', first + 1);
    std::string global, branch;
    if (second == std::string_view::npos || std::from_chars(name.data(), name.data() + first, xid.format).ec != std::errc())
        return false;
    if (!Decode(name.substr(first + 1, second - first - 1), global) || !Decode(name.substr(second + 1), branch))
        return false;
    xid.global_length = static_cast<std::uint8_t>(global.size());
    xid.branch_length = static_cast<std::uint8_t>(branch.size());
    global += branch;
    std::copy(global.begin(), global.end(), xid.data.begin());
    return true;
}

constexpr int kNoSuchBranch = 24756;

}  // namespace

// A transaction that the server has given no number has changed and locked nothing. One that has changed rows need not be
// asked about.
Status PgConnection::Prepare(const Xid& xid, bool& read_only) {
    read_only = false;
    const std::string command = "prepare transaction '" + NameOf(xid) + "'";
    if (!home_->TwoPhase()) return Refused(errors::kUnsupported, "the server has max_prepared_transactions = 0");
    if (Status status = Enter(); !status.Ok()) return status;
    if (Status settled = lobs_->Settle(); settled.Failed()) return Lose(settled);
    Result number;
    Status asked = changed_ ? Status() : Ask("select pg_catalog.pg_current_xact_id_if_assigned()::text", {}, number);
    if (!asked.Ok()) return asked;
    if (!in_transaction_ || (!changed_ && PQgetisnull(number.get(), 0, 0))) {
        Status status = Commit();
        read_only = status.Ok();
        return status;
    }
    Status status = wire_->Run(command.c_str());
    Note();
    return !status.Ok() && in_transaction_ ? Lose(status) : status;
}

// One that was prepared in another database of the server, which it answers with what it does not support, is none of this.
Status PgConnection::FinishPrepared(const char* verb, const Xid& xid) {
    const std::string command = std::string(verb) + " prepared '" + NameOf(xid) + "'";
    if (!home_->TwoPhase()) return Refused(errors::kUnsupported, "the server has max_prepared_transactions = 0");
    if (Status status = Enter(); !status.Ok()) return status;
    if (in_transaction_) return Refused(24776, "a transaction is open");
    Status status = wire_->Run(command.c_str());
    const bool missing = status.Number() == errors::kNoSuchObject || status.Number() == errors::kUnsupported;
    return missing ? Refused(kNoSuchBranch) : status;
}

Status PgConnection::CommitPrepared(const Xid& xid) { return FinishPrepared("commit", xid); }
Status PgConnection::RollbackPrepared(const Xid& xid) { return FinishPrepared("rollback", xid); }

Status PgConnection::Recover(std::vector<Xid>& prepared) {
    if (!home_->TwoPhase()) return Refused(errors::kUnsupported, "the server has max_prepared_transactions = 0");
    Result names;
    Status status = Ask("select gid from pg_catalog.pg_prepared_xacts where database = pg_catalog.current_database()"
                        " order by prepared", {}, names);
    for (int row = 0; status.Ok() && row < PQntuples(names.get()); ++row) {
        Xid xid;
        if (ReadName(PQgetvalue(names.get(), row, 0), xid)) prepared.push_back(xid);
    }
    return status;
}

// Names are the cluster's, not the database's. The function behind the view joins nothing to them; it is asked by a statement
// that the server keeps, once more where the application has dropped all of those.
Status PgConnection::KeepsPrepared(const Xid& xid, bool& kept) {
    kept = false;
    if (!home_->TwoPhase()) return {};
    if (Status status = Enter(); !status.Ok()) return status;
    const std::string name = NameOf(xid);
    const Wire::Values values{{name.c_str()}, {0}, {0}};
    for (;;) {
        const bool is_new = branch_question_.empty();
        if (is_new) {
            branch_question_ = NewName();    // another each time: who knows whether the last one is there
            wire_->SendPrepare(branch_question_.c_str(), "select 1 from pg_catalog.pg_prepared_xact() where gid = $1", {});
        }
        wire_->SendExecute(branch_question_.c_str(), values, false);
        wire_->Sync();
        Result found;
        Status status = wire_->Drain(&found);
        Note();
        kept = status.Ok() && PQntuples(found.get()) > 0;
        if (status.Ok()) return status;
        branch_question_.clear();
        if (in_transaction_) return Lose(status);
        if (is_new || wire_->Broken()) return status;
    }
}

}  // namespace engine::postgres
