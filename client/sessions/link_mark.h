// A mark in the transaction of a link that part of a call can be undone to. The session may go before the part has
// ended, and the transaction end: the mark goes with them, and what follows is none of its business.
#pragma once

#include <memory>
#include <utility>

#include "handles/errors.h"
#include "sessions/link.h"

// Under the link's serial lock. Undoes by itself when it goes without an answer.
class LinkMark {
public:
    explicit LinkMark(std::shared_ptr<Link> link) : link_(std::move(link)) {}
    ~LinkMark() {
        bool is_undone = false;
        if (is_set_) (void)Undo(is_undone);
    }
    LinkMark(const LinkMark&) = delete;
    LinkMark& operator=(const LinkMark&) = delete;

    Status Set() {
        began_ = !link_->Engine().InTransaction();
        Status status = link_->Engine().SetMark();
        is_set_ = status.Ok();
        return status;
    }
    Status Keep() {
        Status status = TakeStanding() ? link_->Engine().DropMark() : Status();
        return status.Number() == errors::kNoSuchSavepoint ? Status() : status;
    }
    Status Undo(bool& is_undone) {
        if (!TakeStanding()) return {};
        Status status = link_->Engine().UndoToMark();
        is_undone = status.Number() != errors::kNoSuchSavepoint;
        if (!status.Ok()) return status;
        return began_ ? link_->Engine().Rollback() : link_->Engine().DropMark();
    }

private:
    bool TakeStanding() {
        is_set_ = false;
        return !link_->Closed() && link_->Engine().InTransaction();
    }

    const std::shared_ptr<Link> link_;
    bool began_ = false;
    bool is_set_ = false;
};
