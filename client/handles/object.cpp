// The tree of objects: who hangs below whom, what dies with what.
#include "handles/object.h"

#include "handles/environment.h"
#include "handles/in_flight.h"

std::string& Object::KeptText(std::uint32_t attribute) {
    for (auto& [kept, text] : kept_texts_) {
        if (kept == attribute) return text;
    }
    return kept_texts_.emplace_front(attribute, std::string()).second;
}

// While it waits the object may have gone over to another mutex.
void SerialLock::LockThreaded(Object& object) {
    while (Lock(object.Serial()) && object.Serial() != mutex_) Unlock();
}

SerialLock::SerialLock(Object& object, std::try_to_lock_t) {
    if (object.Env().Threaded()) mutex_ = object.Serial();
    owns_ = !mutex_ || mutex_->try_lock();
}

bool SerialLock::Lock(Mutex mutex) {
    mutex_ = std::move(mutex);
    if (!mutex_ || mutex_->try_lock()) return false;
    const LongCall wait;
    mutex_->lock();
    return true;
}

void SerialLock::Unlock() noexcept {
    if (!owns_) return;
    mutex_->unlock();
    in_flight::GaveUpLock();
}

void* ObjectTree::Reserve(Environment& environment, std::size_t size) { return environment.Allocate(size); }

void ObjectTree::Unreserve(Environment& environment, void* memory) noexcept { environment.Release(memory); }

void ObjectTree::Adopt(Object& object, Kind kind, std::size_t extra) {
    Environment& environment = object.Env();
    object.born_ = in_flight::Now();
    void* user_memory = extra > 0 ? environment.Allocate(extra) : nullptr;
    try {
        Link(object, kind);
    } catch (...) {
        environment.Release(user_memory);
        throw;
    }
    object.user_memory_ = user_memory;
    if (in_flight::Closed()) in_flight::Close();    // the LongCall knows it, too
}

// What hangs below an object that another thread has just withdrawn is never found, and goes with it.
void ObjectTree::Link(Object& object, Kind kind) {
    const std::lock_guard lock(object.Env().tree_mutex_);
    Object* parent = object.parent_;
    if (!parent || live::Contains(parent)) live::Insert(&object, kind);
    if (!parent) return;
    object.next_ = parent->first_child_;
    if (object.next_) object.next_->previous_ = &object;
    parent->first_child_ = &object;
}

void ObjectTree::Unlink(Object& object) noexcept {
    if (!object.parent_) return;
    if (object.previous_) object.previous_->next_ = object.next_;
    else object.parent_->first_child_ = object.next_;
    if (object.next_) object.next_->previous_ = object.previous_;
    object.previous_ = object.next_ = nullptr;
}

// Takes the object and all below it out of the set of living objects; false when the object was out already.
bool ObjectTree::Withdraw(Object& object) noexcept {
    const bool was_living = live::Erase(&object);
    object.Withdrawn();
    for (Object* child = object.first_child_; child; child = child->next_) Withdraw(*child);
    return was_living;
}

// Of the threads that destroy the same object, the one that withdraws it goes on.
bool ObjectTree::Destroy(Object* object) noexcept {
    {
        const std::lock_guard lock(object->Env().tree_mutex_);
        if (!Withdraw(*object)) return false;
        Unlink(*object);
    }
    in_flight::Retire(*object);
    return true;
}

// The youngest child first: what was made later may lean on what was made before. Nobody knows the object or what hangs
// below it: the links need no lock any more.
void ObjectTree::DestroyTree(Object* object) noexcept {
    while (Object* child = object->first_child_) {
        Unlink(*child);
        DestroyTree(child);
    }
    Environment& environment = object->Env();
    environment.Release(object->user_memory_);
    if (object == static_cast<Object*>(&environment)) return environment.Close();
    object->~Object();
    environment.Release(object);
}
