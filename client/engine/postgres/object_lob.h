// A large object that the server keeps for itself, by the number that a column holds. It is read and written in place, by
// the transaction, and has no drafts; which of its bytes have become others since it was fetched the server does not tell,
// so it reads what it holds now.
#pragma once

#include <vector>

#include "engine/postgres/row_lob.h"

namespace engine::postgres {

struct Question;

class ObjectLob final : public RowLob {
public:
    ObjectLob(PgLobStore& store, const LobView& view) : RowLob(store, view), object_(view.object) {}

    [[nodiscard]] bool IsSame(const Lob& other) const override;
    [[nodiscard]] std::uint64_t Version() const override { return shared_->store ? shared_->store->object_changes_ : 0; }
    Status Length(std::uint64_t& bytes) override;
    Status Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) override;
    Status Write(std::uint64_t offset, std::span<const std::byte> in) override;
    Status Trim(std::uint64_t bytes) override;

private:
    Status CheckRead() override;
    Status Ask(const char* sql, const Question& question, Result& found);
    Status AskOpened(std::uint32_t mode, const char* sql, std::uint64_t value, Result& found);
    Status ReadWindow(std::uint64_t offset, std::size_t wanted);

    Oid object_;
    std::uint64_t next_ = 0;               // where a read that goes on begins
    std::vector<std::byte> window_;        // what was read ahead from there on, as it was at that moment
    std::size_t taken_ = 0;                // bytes of it
    std::uint64_t window_moment_ = 0;
};

}  // namespace engine::postgres
