#include "engine/postgres/object_lob.h"

#include <algorithm>
#include <cstring>
#include <span>

#include "engine/postgres/binary.h"
#include "engine/postgres/question.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::uint64_t kLongest = std::uint64_t{INT32_MAX} * 2048;    // bytes of an object, as the server has it
constexpr std::size_t kWindow = std::size_t{1} << 18;            // that are read ahead
constexpr std::size_t kLargestWindow = std::size_t{1} << 26;
constexpr std::size_t kMostWritten = std::size_t{8} << 20;       // as one value
constexpr std::uint32_t kToRead = 0x40000, kToWrite = 0x20000;   // the server's modes of opening

}  // namespace

// Rows may share an object.
bool ObjectLob::IsSame(const Lob& other) const {
    const auto* object = dynamic_cast<const ObjectLob*>(&other);
    return object && object->shared_ == shared_ && object->object_ == object_;
}

// The row may hold another object by now.
Status ObjectLob::CheckRead() {
    if (!shared_->store) return Error(errors::kInvalidLocator);
    if (!is_current_ || !InItsTransaction() || seen_at_ == Store().Now()) return {};
    std::uint64_t number = 0;
    if (Status status = FindLatest(true, version_, number); status.Failed()) return status;
    object_ = static_cast<Oid>(number);
    return {};
}

Status ObjectLob::Ask(const char* sql, const Question& question, Result& found) {
    const Wire::Heeding heeding(Store().connection_.Server());
    Status status = Store().connection_.AskGuarded(sql, question.values, found);
    if (status.Number() == errors::kNoSuchObject) return Refused(errors::kNoLobValue, status.Detail());
    const bool answered = PQntuples(found.get()) == 1 && !PQgetisnull(found.get(), 0, 0);
    if (status.Ok() && !answered) return Refused(errors::kInternalError, "an answer without a value");
    return status;
}

// `sql` is of the opened object, kelp_f; it is closed behind that.
Status ObjectLob::AskOpened(std::uint32_t mode, const char* sql, std::uint64_t value, Result& found) {
    const Question question({std::to_string(object_), std::to_string(mode), std::to_string(value)});
    const std::string whole =
        "with kelp_o as materialized (select pg_catalog.lo_open($1::oid, $2::int) as kelp_f),"
        " kelp_v as materialized (select kelp_f, " + std::string(sql) + "::bigint as kelp_n from kelp_o)"
        " select kelp_n, pg_catalog.lo_close(kelp_f) from kelp_v where $3::bigint is not null";
    return Ask(whole.c_str(), question, found);
}

Status ObjectLob::Length(std::uint64_t& bytes) {
    if (Status status = CheckRead(); status.Failed()) return status;
    Result found;
    constexpr std::uint64_t kFromTheEnd = 0;
    Status status = AskOpened(kToRead, "pg_catalog.lo_lseek64(kelp_f, $3::bigint, 2)", kFromTheEnd, found);
    if (!status.Ok()) return status;
    bytes = static_cast<std::uint64_t>(Get<std::int64_t>(PQgetvalue(found.get(), 0, 0)));
    return status;
}

// What was read ahead counts for reads that go on, so that one that begins anew sees what others have written.
Status ObjectLob::Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) {
    read = 0;
    if (Status status = CheckRead(); status.Failed()) return status;
    const std::uint64_t moment = Store().Now() + Store().object_changes_;
    if (offset != next_ || moment != window_moment_) window_.clear(), taken_ = 0;
    window_moment_ = moment;
    next_ = offset;
    while (read < out.size()) {
        if (taken_ == window_.size()) {
            if (Status status = ReadWindow(next_, out.size() - read); status.Failed()) return status;
            if (window_.empty()) return {};
        }
        const std::size_t part = std::min(out.size() - read, window_.size() - taken_);
        std::memcpy(out.data() + read, window_.data() + taken_, part);
        read += part;
        taken_ += part;
        next_ += part;
    }
    return {};
}

Status ObjectLob::ReadWindow(std::uint64_t offset, std::size_t wanted) {
    window_.clear();
    taken_ = 0;
    if (offset >= kLongest) return {};
    const std::size_t most = std::clamp(wanted, kWindow, kLargestWindow);
    const Question question({std::to_string(object_), std::to_string(offset), std::to_string(most)});
    Result found;
    Status status = Ask("select pg_catalog.lo_get($1::oid, $2::bigint, $3::int)", question, found);
    if (!status.Ok()) return status;
    const auto bytes = std::as_bytes(std::span(Field(found, 0, 0)));
    window_.assign(bytes.begin(), bytes.end());
    return status;
}

Status ObjectLob::Write(std::uint64_t offset, std::span<const std::byte> in) {
    if (Status status = CheckWrite(); status.Failed()) return status;
    if (offset > kLongest || in.size() > kLongest - offset) return Refused(errors::kLobTooLarge);
    while (!in.empty()) {
        const auto piece = in.first(std::min(in.size(), kMostWritten));
        Question question({std::to_string(object_), std::to_string(offset)});
        question.Add({reinterpret_cast<const char*>(piece.data()), piece.size()}, true);
        Result none;
        ++Store().object_changes_;
        Status status = Ask("select pg_catalog.lo_put($1::oid, $2::bigint, $3::bytea)", question, none);
        if (!status.Ok()) return status;
        offset += piece.size();
        in = in.subspan(piece.size());
    }
    return {};
}

Status ObjectLob::Trim(std::uint64_t bytes) {
    if (Status status = CheckWrite(); status.Failed()) return status;
    Result none;
    ++Store().object_changes_;
    return AskOpened(kToWrite, "pg_catalog.lo_truncate64(kelp_f, $3::bigint)", bytes, none);
}

}  // namespace engine::postgres
