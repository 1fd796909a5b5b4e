#include "engine/postgres/row_lob.h"

#include <algorithm>

#include "handles/errors.h"

namespace engine::postgres {

RowLob::RowLob(PgLobStore& store, const LobView& view)
    : shared_(store.shared_), column_(*view.column), version_(view.version), seen_at_(view.seen_at),
      transaction_(store.OpenTransaction()) {}

void RowLob::Keep(const LobView& view) {
    if (view.version.table == 0) return;
    row_ = Store().RowOf(view.version);
    is_current_ = transaction_ != 0 && view.is_locked;
    if (is_current_) Store().Hold(*row_, view.version, view.seen_at);
}

bool RowLob::InItsTransaction() const { return Store().InTransaction(transaction_); }

// A row that the transaction has written is its own, however it was fetched.
Status RowLob::CheckWrite() {
    if (!shared_->store) return Error(errors::kInvalidLocator);
    if (!is_current_ && row_ && InItsTransaction()) {
        if (Status status = Store().HasWritten(version_, is_current_); status.Failed()) return status;
        if (is_current_) Store().Hold(*row_, version_, Store().Now());
    }
    if (!is_current_) return Refused(errors::kRowNotLocked);
    if (!InItsTransaction()) return Refused(errors::kLocatorOfOldTransaction);
    return CheckRead();
}

Status RowLob::FindLatest(bool follows, RowVersion& latest, std::uint64_t& measure) {
    latest = row_->versions.back();
    if (Status status = Store().FindLatest(*column_, *row_, follows, latest, measure); status.Failed()) return status;
    Store().Follow(row_, latest, Store().MakeRoom(*row_));
    seen_at_ = Store().Now();
    return {};
}

}  // namespace engine::postgres
