// Locators: descriptors that hold a large object once a fetch, a call or another locator gave them one. A locator shares
// the object and what its session knows of objects; session, statement and environment may end before it.
//
// Threads: Get and Set from any thread; what hangs on the object is used under the lock of its session.
#pragma once

#include <algorithm>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include "engine/lobs.h"
#include "handles/object.h"

namespace values {

// What a session's locators share: one for each session, alive as long as one of them.
struct LobSession {
    engine::LobStore* store = nullptr;    // null once the session has ended

    struct Opened {
        std::shared_ptr<engine::Lob> lob;
        bool writes;
    };
    std::vector<Opened> opened;           // by OCILobOpen
    struct Buffered {
        std::shared_ptr<engine::Lob> lob;
        std::weak_ptr<void> by;           // what is kept with the locator
        bool waits = false;               // what was written through it
    };
    std::vector<Buffered> buffered;
    // Of a locator, by what is kept with it: what was written through it is not the object's yet.
    [[nodiscard]] bool Waits(const std::shared_ptr<void>& kept) const {
        return kept && std::any_of(buffered.begin(), buffered.end(), [&](const Buffered& entry) {
            return entry.waits && entry.by.lock() == kept;
        });
    }
    std::shared_ptr<std::recursive_mutex> serial;    // null in environments without threads
    std::shared_ptr<void> stream;         // a read or write that goes on with its next call; of the lobs room
};

struct Located {
    std::shared_ptr<engine::Lob> lob;            // null: a locator that was never filled
    std::shared_ptr<LobSession> session;
    bool national = false;                       // form SQLCS_NCHAR
    std::shared_ptr<void> kept{};                // of the lobs room: what it knows of this locator
    engine::LobStore* store = nullptr;           // that the object came from; only compared

    // Whether it can be used in a session, which may go on with another connection than the object's.
    [[nodiscard]] bool IsOf(const LobSession* other) const {
        return session.get() == other && (lob->IsTemporary() || store == other->store);
    }
};

}  // namespace values

class LobDescriptor : public Object {
public:
    static constexpr Kind kKind = Kind::lob;
    explicit LobDescriptor(const Origin& origin) : Object(origin) {}

    [[nodiscard]] values::Located Get() const {
        const std::lock_guard lock(mutex_);
        return located_;
    }
    void Set(values::Located located) noexcept {
        const std::lock_guard lock(mutex_);
        std::swap(located_, located);
    }
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

private:
    mutable std::mutex mutex_;
    values::Located located_;
};
