// Links: who uses them, and their end.
#include "sessions/link.h"

#include <utility>

LinkUser::~LinkUser() { Use(nullptr); }

void LinkUser::Use(std::shared_ptr<Link> link) noexcept {
    if (link == link_) return;
    if (link_) link_->Remove(*this);
    link_ = std::move(link);
    if (link_) link_->Add(*this);
}

Link::Link(std::unique_ptr<engine::Connection> connection, bool threaded)
    : connection_(std::move(connection)), serial_(threaded ? std::make_shared<std::recursive_mutex>() : nullptr) {}

Link::~Link() { Close(); }

void Link::Add(LinkUser& user) noexcept {
    const std::lock_guard lock(users_mutex_);
    user.next_ = first_user_;
    if (first_user_) first_user_->previous_ = &user;
    first_user_ = &user;
}

void Link::Remove(LinkUser& user) noexcept {
    const std::lock_guard lock(users_mutex_);
    if (user.previous_) user.previous_->next_ = user.next_;
    else if (first_user_ == &user) first_user_ = user.next_;
    if (user.next_) user.next_->previous_ = user.previous_;
    user.previous_ = user.next_ = nullptr;
}

LinkUser* Link::AnyUser() noexcept {
    const std::lock_guard lock(users_mutex_);
    return first_user_;
}

void Link::Cancel() noexcept {
    const std::lock_guard lock(cancel_mutex_);
    if (connection_) connection_->Cancel();
}

void Link::ForgetCancel() noexcept {
    const std::lock_guard lock(cancel_mutex_);
    if (connection_) connection_->ForgetCancel();
}

std::unique_ptr<engine::Connection> Link::Close() noexcept {
    while (LinkUser* user = AnyUser()) {
        user->LinkClosed();
        user->Use(nullptr);
    }
    statement_cache.reset();
    const std::lock_guard lock(cancel_mutex_);
    return std::move(connection_);
}
