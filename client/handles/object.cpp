// The tree of objects: who hangs below whom, what dies with what.
#include "handles/object.h"

#include "handles/environment.h"
#include "handles/in_flight.h"

namespace {

constinit thread_local bool destroying = false;    // this thread is, and what it destroys destroys others

}  // namespace

std::string& Object::KeptText(std::uint32_t attribute) {
    for (auto& [kept, text] : kept_texts_) {
        if (kept == attribute) return text;
    }
    return kept_texts_.emplace_back(attribute, std::string()).second;
}

void SerialLock::Lock(std::shared_ptr<std::recursive_mutex> mutex) {
    if (mutex) mutex->lock();
    mutex_ = std::move(mutex);
}

void* ObjectTree::Reserve(Environment& environment, std::size_t size) { return environment.Allocate(size); }

void ObjectTree::Unreserve(Environment& environment, void* memory) noexcept { environment.Release(memory); }

void ObjectTree::Adopt(Object& object, Kind kind, std::size_t extra) {
    Environment& environment = object.Env();
    void* user_memory = extra > 0 ? environment.Allocate(extra) : nullptr;
    try {
        Link(object, kind);
    } catch (...) {
        environment.Release(user_memory);
        throw;
    }
    object.user_memory_ = user_memory;
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
    for (Object* child = object.first_child_; child; child = child->next_) Withdraw(*child);
    return was_living;
}

// What dies with something else dies at once: nothing below it is found any more. Of the threads that destroy the same
// object, the one that withdraws it goes on; what was withdrawn with its parent goes with that.
bool ObjectTree::Destroy(Object* object) noexcept {
    {
        const std::lock_guard lock(object->Env().tree_mutex_);
        if (!destroying && !Withdraw(*object)) return false;
        Unlink(*object);
    }
    if (destroying || in_flight::MayDestroy(*object)) DestroyTree(object);
    return true;
}

// The youngest child first: what was made later may lean on what was made before.
void ObjectTree::DestroyTree(Object* object) noexcept {
    const bool outermost = !std::exchange(destroying, true);
    live::Erase(object);    // of what dies with something else, nobody has withdrawn it yet
    while (Object* child = object->first_child_) Destroy(child);
    Environment& environment = object->Env();
    environment.Release(object->user_memory_);
    if (object == static_cast<Object*>(&environment)) {
        environment.Close();
    } else {
        object->~Object();
        environment.Release(object);
    }
    if (outermost) destroying = false;
}
