// Taking, reading and writing columns of rows, drafts, and what the server is asked about rows.
#include "engine/postgres/lob_store.h"

#include <algorithm>
#include <cstring>
#include <new>
#include <span>

#include "engine/postgres/object_lob.h"
#include "engine/postgres/question.h"
#include "engine/postgres/types.h"
#include "engine/temporary_lob.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::uint64_t kLongest = 1'000'000'000;                    // bytes of a value; the server has little more
constexpr std::uint64_t kLongestParameter = std::uint64_t{8} << 20;  // that is written as one
constexpr std::size_t kPiece = std::size_t{1} << 20;                 // of what is longer
// A text is read up to the piece that is wanted, so that pieces of long ones are long.
constexpr std::uint64_t kLeastWindow = std::uint64_t{1} << 18, kLargestWindow = std::uint64_t{1} << 26;
constexpr std::uint64_t kPiecesOfText = 16;

std::string PlaceText(const RowVersion& version) {
    return "(" + std::to_string(version.place >> 16) + "," + std::to_string(version.place & 0xFFFF) + ")";
}

// Of columns "ctid, xmin::text::bigint".
RowVersion VersionIn(const Result& result, int row, int column, Oid table) {
    const char* const place = PQgetvalue(result.get(), row, column);
    return {table, static_cast<std::uint32_t>(Get<std::int64_t>(PQgetvalue(result.get(), row, column + 1))),
            std::uint64_t{Get<std::uint32_t>(place)} << 16 | Get<std::uint16_t>(place + 4)};
}

}  // namespace

// ---- The object of a column

class ColumnLob final : public RowLob {
public:
    ColumnLob(PgLobStore& store, const LobView& view) : RowLob(store, view), length_(view.length) {}

    // The bytes that came with the row; `brief`: they stay where they are.
    Status TakeWhole(std::span<const std::byte> whole, bool brief);
    [[nodiscard]] bool IsSame(const Lob& other) const override {
        const auto* column = dynamic_cast<const ColumnLob*>(&other);
        return column && column->row_ == row_ && column->column_->name == column_->name;
    }
    [[nodiscard]] std::uint64_t Version() const override {
        return is_current_ && shared_->store ? shared_->store->now_ + shared_->store->writes_ : 0;
    }
    Status Length(std::uint64_t& bytes) override;
    Status Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) override;
    Status Write(std::uint64_t offset, std::span<const std::byte> in) override;
    Status Trim(std::uint64_t bytes) override;

private:
    // Where it is read: one of them at most.
    struct Place {
        Lob* draft = nullptr;
        bool whole = false;     // in whole_ or copy_
    };
    Status CheckRead() override;
    Status Find(Place& place);
    Status Refresh(bool follows);
    Status Draft(Lob*& draft);
    Status ReadWindow(std::uint64_t offset, std::size_t wanted);

    std::uint64_t length_;                 // of its version
    std::span<const std::byte> whole_;     // all of that version: the row's own
    std::unique_ptr<ChunkedBytes> copy_;   // or a copy
    bool is_whole_ = false;                // either is there
    std::vector<std::byte> window_;        // of that version, from window_at_ on
    std::uint64_t window_at_ = 0;
};

Status ColumnLob::TakeWhole(std::span<const std::byte> whole, bool brief) {
    is_whole_ = true;
    whole_ = whole;
    if (brief) return {};
    copy_ = std::make_unique<ChunkedBytes>(Store().file_, FillerOf(Kind()));
    return copy_->Write(0, whole);
}

// Whether it can be read, and where. The row's last version is looked for when a statement has run since.
Status ColumnLob::Find(Place& place) {
    if (!shared_->store) return Error(errors::kInvalidLocator);
    const bool in_transaction = is_current_ && InItsTransaction();
    if (in_transaction) place.draft = Store().FindDraft(*row_, *column_);
    if (place.draft) return {};
    if (is_current_ && seen_at_ != Store().now_) {
        if (Status status = Refresh(in_transaction); status.Failed()) return status;
    }
    place.whole = is_whole_;
    return {};
}

Status ColumnLob::CheckRead() {
    Place place;
    return Find(place);
}

// What the row holds now; once the transaction is over, as long as nobody else has changed it.
Status ColumnLob::Refresh(bool follows) {
    RowVersion latest;
    std::uint64_t length = 0;
    if (Status status = FindLatest(follows, latest, length); status.Failed()) return status;
    if (latest != version_) {
        is_whole_ = false;
        window_.clear();
    }
    version_ = latest;
    length_ = length;
    return {};
}

Status ColumnLob::Length(std::uint64_t& bytes) {
    Place place;
    if (Status status = Find(place); status.Failed()) return status;
    if (place.draft) return place.draft->Length(bytes);
    bytes = length_;
    return {};
}

Status ColumnLob::Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) {
    read = 0;
    Place place;
    if (Status status = Find(place); status.Failed()) return status;
    if (place.draft) return place.draft->Read(offset, out, read);
    if (offset >= length_) return {};
    out = out.first(static_cast<std::size_t>(std::min<std::uint64_t>(out.size(), length_ - offset)));
    if (place.whole && copy_) return copy_->Read(offset, out, read);
    if (place.whole) {
        std::memcpy(out.data(), whole_.data() + offset, out.size());
        read = out.size();
        return {};
    }
    while (read < out.size()) {
        const std::uint64_t at = offset + read;
        if (at < window_at_ || at >= window_at_ + window_.size()) {
            if (Status status = ReadWindow(at, out.size() - read); status.Failed()) return status;
        }
        const auto from = static_cast<std::size_t>(at - window_at_);
        const std::size_t part = std::min(out.size() - read, window_.size() - from);
        std::memcpy(out.data() + read, window_.data() + from, part);
        read += part;
    }
    return {};
}

Status ColumnLob::ReadWindow(std::uint64_t offset, std::size_t wanted) {
    std::uint64_t most = kLeastWindow;
    if (Kind() == LobKind::characters) most = std::clamp(length_ / kPiecesOfText, kLeastWindow, kLargestWindow);
    most = std::max<std::uint64_t>(most, std::min<std::uint64_t>(wanted, kLargestWindow));
    most = std::min(most, length_ - offset);
    window_.clear();
    Result found;
    Status status = Store().ReadVersion(*column_, version_, offset, static_cast<std::size_t>(most), found);
    if (status.Failed()) return status;
    const auto bytes = std::as_bytes(std::span(Field(found, 0, 0)));
    if (bytes.size() != most) return Refused(errors::kSnapshotTooOld);
    window_.assign(bytes.begin(), bytes.end());
    window_at_ = offset;
    return {};
}

// The draft of the value, which is made when there is none.
Status ColumnLob::Draft(Lob*& draft) {
    draft = Store().FindDraft(*row_, *column_);
    if (draft) return {};
    Store().Follow(row_, version_, Store().MakeRoom(*row_));    // later ones may be undone
    auto made = std::make_shared<TemporaryLob>(Kind(), Store().file_);
    Store().drafts_.reserve(Store().drafts_.size() + 1);
    if (Status status = CopyBytes(*this, 0, *made, 0, length_); status.Failed()) return status;
    draft = made.get();
    Store().drafts_.push_back({row_, column_, std::move(made)});
    return {};
}

Status ColumnLob::Write(std::uint64_t offset, std::span<const std::byte> in) {
    if (Status status = CheckWrite(); status.Failed()) return status;
    if (offset > kLongest || in.size() > kLongest - offset) return Refused(errors::kLobTooLarge);
    Lob* draft = nullptr;
    if (Status status = Draft(draft); status.Failed()) return status;
    ++Store().writes_;
    return draft->Write(offset, in);
}

Status ColumnLob::Trim(std::uint64_t bytes) {
    if (Status status = CheckWrite(); status.Failed()) return status;
    std::uint64_t length = 0;
    if (Status status = Length(length); status.Failed() || length == bytes) return status;
    Lob* draft = nullptr;
    if (Status status = Draft(draft); status.Failed()) return status;
    ++Store().writes_;
    return draft->Trim(bytes);
}

// ---- The store

PgLobStore::PgLobStore(PgConnection& connection)
    : connection_(connection), shared_(std::make_shared<Shared>(Shared{this})) {}

PgLobStore::~PgLobStore() { shared_->store = nullptr; }

Status PgLobStore::CreateTemporary(LobKind kind, std::shared_ptr<Lob>& lob) {
    lob = std::make_shared<TemporaryLob>(kind, file_);
    return {};
}

Status PgLobStore::Take(const Datum& value, bool brief, std::shared_ptr<Lob>& lob) {
    LobView view;
    std::memcpy(&view, value.data, sizeof view);
    if ((*view.column)->is_object) {
        auto made = std::make_shared<ObjectLob>(*this, view);
        if (!brief) made->Keep(view);
        lob = std::move(made);
        return {};
    }
    auto made = std::make_shared<ColumnLob>(*this, view);
    if (!brief) made->Keep(view);
    if (view.is_whole) {
        const std::span whole(static_cast<const std::byte*>(value.data) + sizeof view, static_cast<std::size_t>(view.length));
        if (Status status = made->TakeWhole(whole, brief); status.Failed()) return status;
    }
    lob = std::move(made);
    return {};
}

std::uint64_t PgLobStore::OpenTransaction() const { return connection_.InTransaction() ? transaction_ : 0; }

bool PgLobStore::InTransaction(std::uint64_t number) const {
    return number != 0 && number == transaction_ && connection_.InTransaction();
}

// ---- Rows

std::shared_ptr<LobRow> PgLobStore::RowOf(const RowVersion& version) {
    if (const auto found = rows_.find(version); found != rows_.end()) {
        if (auto row = found->second.lock()) return row;
    }
    Sweep();
    auto row = std::make_shared<LobRow>();
    row->versions.push_back(version);
    rows_[version] = row;
    return row;
}

PgLobStore::Rows::node_type PgLobStore::MakeRoom(LobRow& row) {
    row.versions.reserve(row.versions.size() + 1);
    rows_.reserve(rows_.size() + 1);
    Rows room;
    room.try_emplace(RowVersion());
    return room.extract(room.begin());
}

// The row is of that version now. What was known to be of it is the same row from now on.
void PgLobStore::Follow(std::shared_ptr<LobRow>& row, const RowVersion& version, Rows::node_type room) {
    if (row->versions.back() == version) return;
    std::shared_ptr<LobRow> other;
    if (const auto found = rows_.find(version); found != rows_.end()) other = found->second.lock();
    if (other && other != row) {
        other->versions.insert(other->versions.begin(), row->versions.begin(), row->versions.end());
        Hold(*other, row->anchor, row->held_at);
        row = std::move(other);
    }
    std::erase(row->versions, version);
    row->versions.push_back(version);
    room.key() = version;
    room.mapped() = row;
    if (auto known = rows_.insert(std::move(room)); !known.inserted) known.position->second = row;
}

// The first one that stands outlasts the others: what undoes it undoes those behind it.
void PgLobStore::Hold(LobRow& row, const RowVersion& version, std::uint64_t at) noexcept {
    if (!Stands(at) || (Stands(row.held_at) && row.held_at <= at)) return;
    row.anchor = version;
    row.held_at = at;
    last_held_at_ = std::max(last_held_at_, at);
}

bool PgLobStore::Stands(std::uint64_t at) const noexcept {
    if (at == 0 || at < all_undone_at_) return false;
    const auto behind = std::upper_bound(undone_.begin(), undone_.end(), at,
                                         [](std::uint64_t moment, const Stretch& stretch) { return moment < stretch.until; });
    return behind == undone_.end() || behind->since >= at;
}

// Stretches that meet where nothing was held are one, so that rows that fail in a row need no room.
void PgLobStore::Undone(std::uint64_t since) noexcept try {
    ++object_changes_;
    ++now_;
    const auto joins = [&](const Stretch& last) {
        return last.since >= since || (last.until >= since && last_held_at_ < since);
    };
    for (; !undone_.empty() && joins(undone_.back()); undone_.pop_back()) since = std::min(since, undone_.back().since);
    if (since > 0) undone_.push_back({since, now_});
    else all_undone_at_ = now_;
} catch (const std::bad_alloc&) {
    undone_.clear();
    all_undone_at_ = now_;
}

// Rows that nobody holds are forgotten once in a while.
void PgLobStore::Sweep() {
    if (rows_.size() < sweep_at_) return;
    std::erase_if(rows_, [](const auto& entry) { return entry.second.expired(); });
    sweep_at_ = 2 * rows_.size() + 64;
}

Status PgLobStore::ReadVersion(const LobColumn& column, const RowVersion& version, std::uint64_t offset,
                               std::size_t most, Result& found) {
    std::shared_ptr<const Table> table;
    if (Status status = connection_.TableOf(version.table, table); !status.Ok()) return status;
    const Question question({PlaceText(version), std::to_string(version.transaction), std::to_string(offset + 1),
                             std::to_string(most)});
    const std::string sql = "select pg_catalog.substring(" + BytesOf(column, column.name) + ", $3::int, $4::int) from only " +
                            table->name + " where ctid = $1::tid and xmin = $2::xid";
    const Wire::Heeding heeding(connection_.Server());
    Status status = connection_.AskGuarded(sql, question.values, found);
    if (status.Ok() && (PQntuples(found.get()) != 1 || PQgetisnull(found.get(), 0, 0))) return WhyMissing(version);
    return status;
}

// A version that went: the row did, or has another one.
Status PgLobStore::WhyMissing(const RowVersion& version) {
    std::shared_ptr<const Table> table;
    if (Status status = connection_.TableOf(version.table, table); !status.Ok()) return status;
    const Question question({table->name, PlaceText(version)});
    Result found;
    Status status = connection_.AskGuarded("select 1 from only " + table->name +
                                               " where ctid = (select pg_catalog.currtid2($1::text, $2::tid))",
                                           question.values, found);
    if (connection_.Server().Broken() || IsPassing(status)) return status;
    return Refused(status.Ok() && PQntuples(found.get()) > 0 ? errors::kSnapshotTooOld : errors::kNoLobValue);
}

// The server follows updates from one version to the next. It does so from any that is known, but what it finds is the row
// only if it started from the anchor: where others lay that are undone, or were not locked, other rows may lie by now.
Status PgLobStore::FindLatest(const LobColumn& column, const LobRow& row, bool follows, RowVersion& latest,
                              std::uint64_t& measure) {
    const Oid oid = latest.table;
    std::shared_ptr<const Table> table;
    if (Status status = connection_.TableOf(oid, table); !status.Ok()) return status;
    std::string places;
    for (const RowVersion& version : row.versions) places += (places.empty() ? "\"" : ",\"") + PlaceText(version) + '"';
    const bool has_anchor = follows && Stands(row.held_at);
    const Question question({"{" + places + "}", table->name, has_anchor ? PlaceText(row.anchor) : "(0,0)"});
    const std::string sql =
        "with kelp_v(place) as (select pg_catalog.unnest($1::tid[])) select ctid, xmin::text::bigint, " +
        MeasureOf(column, column.name, connection_.Server().ServerHasUtf8()) + "::bigint, "
        "ctid = case when $3::tid <> '(0,0)' then pg_catalog.currtid2($2::text, $3::tid) end from only " + table->name +
        " where ctid = any(array(select place from kelp_v union select pg_catalog.currtid2($2::text, place) from kelp_v))";
    Result found;
    Status status = connection_.AskGuarded(sql, question.values, found);
    const bool says_why = connection_.Server().Broken() || !connection_.InTransaction() || IsPassing(status);
    if (!status.Ok()) return says_why ? status : Refused(errors::kNoLobValue);
    int fits = -1, next = -1, other = -1;
    for (int index = 0; index < PQntuples(found.get()); ++index) {
        const RowVersion version = VersionIn(found, index, 0, oid);
        const bool is_known = std::find(row.versions.begin(), row.versions.end(), version) != row.versions.end();
        const bool is_of_anchor = !PQgetisnull(found.get(), index, 3) && *PQgetvalue(found.get(), index, 3) != 0;
        (is_known ? fits : is_of_anchor ? next : other) = index;
    }
    if (fits < 0) fits = next;
    if (fits < 0) return Refused(other < 0 ? errors::kNoLobValue : errors::kSnapshotTooOld);
    if (PQgetisnull(found.get(), fits, 2)) return Refused(errors::kNoLobValue);
    latest = VersionIn(found, fits, 0, oid);
    measure = static_cast<std::uint64_t>(Get<std::int64_t>(PQgetvalue(found.get(), fits, 2)));
    return {};
}

// What can be seen of a transaction that still runs is this one's. Numbers of rows lack the upper half that the server
// wants: it is that of the transaction that runs, or one beside.
Status PgLobStore::HasWritten(const RowVersion& version, bool& written) {
    std::shared_ptr<const Table> table;
    if (Status status = connection_.TableOf(version.table, table); !status.Ok()) return status;
    const Question question({PlaceText(version), std::to_string(version.transaction)});
    Result found;
    Status status = connection_.AskGuarded(
        "select pg_catalog.txid_status(kelp_now + (($2::bigint - kelp_now + 2147483648) & 4294967295) - 2147483648) = "
        "'in progress'"
        " from only " + table->name + ", pg_catalog.txid_current_if_assigned() kelp_now"
            " where ctid = $1::tid and xmin = ($2::bigint)::text::xid",
        question.values, found);
    if (!status.Ok()) return status;
    written = PQntuples(found.get()) == 1 && !PQgetisnull(found.get(), 0, 0) && *PQgetvalue(found.get(), 0, 0) != 0;
    return {};
}

// ---- Drafts

Lob* PgLobStore::FindDraft(const LobRow& row, const LobColumn& column) {
    const auto found = std::find_if(drafts_.begin(), drafts_.end(), [&](const Draft& draft) {
        return draft.row.get() == &row && draft.column->name == column.name;
    });
    return found == drafts_.end() ? nullptr : found->value.get();
}

void PgLobStore::Forget() noexcept {
    drafts_.clear();
    ++now_;
}

Status PgLobStore::Settle() {
    if (drafts_.empty()) return {};
    auto drafts = std::exchange(drafts_, {});
    if (!connection_.InTransaction()) return {};    // lost with it
    Status first;
    for (Draft& draft : drafts) {
        if (!connection_.InTransaction()) break;    // lost with one before
        Status status;
        try {
            status = Flush(draft);
        } catch (const std::bad_alloc&) {
            status = Refused(errors::kOutOfMemory);
        }
        if (status.Number() != errors::kOutOfMemory) draft.value = nullptr;
        if (first.Ok()) first = std::move(status);
    }
    ++now_;
    std::erase_if(drafts, [](const Draft& draft) { return !draft.value; });
    if (connection_.InTransaction()) drafts_ = std::move(drafts);
    return first;
}

// What is long goes to the server in pieces, as an object of its own for as long as that takes.
Status PgLobStore::Flush(Draft& draft) {
    std::uint64_t length = 0;
    if (Status status = draft.value->Length(length); status.Failed()) return status;
    const bool is_text = draft.column->kind == LobKind::characters;
    if (length <= kLongestParameter) {
        std::vector<std::byte> bytes(static_cast<std::size_t>(length));
        std::size_t read = 0;
        if (Status status = draft.value->Read(0, bytes, read); status.Failed()) return status;
        return Update(draft, is_text ? "$1::text" : "$1::bytea", {reinterpret_cast<const char*>(bytes.data()), read});
    }
    Oid object = 0;
    if (Status status = Upload(*draft.value, length, object); status.Failed()) return status;
    const std::string number = std::to_string(object);
    const std::string whole = "pg_catalog.lo_get(" + number + "::oid)";
    Status status = Update(draft, is_text ? "pg_catalog.convert_from(" + whole + ", 'UTF8')" : whole, {});
    if (!connection_.InTransaction()) return status;
    Result gone;
    Status unlinked = connection_.AskGuarded("select pg_catalog.lo_unlink(" + number + "::oid)", {}, gone);
    return status.Ok() ? unlinked : status;
}

Status PgLobStore::Upload(Lob& value, std::uint64_t length, Oid& object) {
    Result made;
    if (Status status = connection_.AskGuarded("select pg_catalog.lo_create(0)", {}, made); !status.Ok()) return status;
    object = Get<std::uint32_t>(PQgetvalue(made.get(), 0, 0));
    std::vector<std::byte> piece(kPiece);
    for (std::uint64_t done = 0; done < length;) {
        std::size_t read = 0;
        if (Status status = value.Read(done, piece, read); status.Failed()) return status;
        Question question({std::to_string(object), std::to_string(done)});
        question.Add({reinterpret_cast<const char*>(piece.data()), read}, true);
        Result put;
        Status status = connection_.AskGuarded("select pg_catalog.lo_put($1::oid, $2::bigint, $3::bytea)",
                                               question.values, put);
        if (!status.Ok()) return status;
        done += read;
    }
    return {};
}

Status PgLobStore::Update(Draft& draft, const std::string& expression, std::string_view value) {
    const RowVersion version = draft.row->versions.back();
    std::shared_ptr<const Table> table;
    if (Status status = connection_.TableOf(version.table, table); !status.Ok()) return status;
    const bool has_value = expression.starts_with('$');
    Question question(std::vector<std::string>{});
    if (has_value) question.Add(value, true);
    const std::string places[] = {PlaceText(version), std::to_string(version.transaction)};
    for (const std::string& place : places) question.Add(place, false);
    const std::string sql = "update only " + table->name + " set " + draft.column->name + " = " + expression +
                            " where ctid = $" + (has_value ? "2" : "1") + "::tid and xmin = $" + (has_value ? "3" : "2") +
                            "::xid returning ctid, xmin::text::bigint";
    Rows::node_type room = MakeRoom(*draft.row);
    Result changed;
    if (Status status = connection_.AskGuarded(sql, question.values, changed); !status.Ok()) return status;
    if (PQntuples(changed.get()) != 1) return Refused(errors::kNoLobValue);
    const RowVersion made = VersionIn(changed, 0, 0, version.table);
    Follow(draft.row, made, std::move(room));
    Hold(*draft.row, made, now_ + 1);    // behind the settling
    return {};
}

}  // namespace engine::postgres
