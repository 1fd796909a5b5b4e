// Calls in flight, counted in epochs. Each retired object gets the number of a new epoch; a call carries the number of
// the epoch in which it began; an object is destroyed when no running call is older than it.
//
// The entering thread stores its epoch and then looks into the set of living objects; the retiring thread takes the
// object out of the set and then looks at the epochs. Neither may overtake the other's store. The barrier for that is
// the system's, made for all threads by the retiring one; where there is none, entering threads fence themselves.
#include "handles/in_flight.h"

#include <linux/membarrier.h>
#include <pthread.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <mutex>
#include <utility>

#include "handles/environment.h"

namespace in_flight {

constinit std::atomic<Epoch> current_epoch{1};
constinit std::atomic<bool> somebody_waits{false};
[[gnu::tls_model("initial-exec")]] constinit thread_local Slot* own_slot = nullptr;

static bool RegisterBarrier() {
    return syscall(SYS_membarrier, MEMBARRIER_CMD_REGISTER_PRIVATE_EXPEDITED, 0, 0) == 0;
}
const bool system_barrier = RegisterBarrier();

}  // namespace in_flight

namespace {

using namespace in_flight;

constinit std::atomic<Slot*> slots{nullptr};
constinit std::atomic<unsigned> slots_taken{0};

// Orders what this thread did before against what every running thread does after.
void BarrierForAll() {
    std::atomic_thread_fence(std::memory_order_seq_cst);
    if (system_barrier && slots_taken.load(std::memory_order_relaxed) > 1) {
        syscall(SYS_membarrier, MEMBARRIER_CMD_PRIVATE_EXPEDITED, 0, 0);
    }
}

Slot* FreeSlot() {
    for (Slot* slot = slots.load(std::memory_order_acquire); slot; slot = slot->next) {
        if (!slot->taken.exchange(true, std::memory_order_acq_rel)) return slot;
    }
    return nullptr;
}

Slot* NewSlot() {
    auto* slot = new Slot;
    slot->next = slots.load(std::memory_order_relaxed);
    while (!slots.compare_exchange_weak(slot->next, slot, std::memory_order_acq_rel)) {}
    return slot;
}

void LeaveSlot(void* slot) {
    own_slot = nullptr;
    slots_taken.fetch_sub(1, std::memory_order_relaxed);
    static_cast<Slot*>(slot)->taken.store(false, std::memory_order_release);
}

// The system's thread-specific data outlives the language's, as the values of the thread package's keys do.
pthread_key_t SlotKey() {
    static const pthread_key_t key = [] {
        pthread_key_t made{};
        if (pthread_key_create(&made, LeaveSlot) != 0) std::abort();
        return made;
    }();
    return key;
}

// The oldest call that another thread is in; `limit` when none is older.
Epoch OldestCall(Epoch limit, const Slot* but) {
    for (const Slot* slot = slots.load(std::memory_order_acquire); slot; slot = slot->next) {
        const Epoch entered = slot->entered.load(std::memory_order_acquire);
        if (slot != but && entered != kOutside && entered < limit) limit = entered;
    }
    return limit;
}

}  // namespace

// What waits to be destroyed. Other objects go before environments, whose memory they lie in: a thread may free one of
// an environment that another has just retired.
class RetiredObjects {
public:
    // Answers whether the object may be destroyed at once; else it waits here.
    bool Ripe(Object& object) noexcept;
    void DestroyRipe() noexcept;

private:
    struct Queue {
        Object* first = nullptr;
        Object* last = nullptr;
    };
    void Append(Object& object);
    Object* TakeRipe();
    Object* TakeFirst(Queue& queue);

    std::mutex mutex_;
    Queue objects_;
    Queue environments_;
    bool destroying_ = false;    // some thread is at it
    bool look_again_ = false;    // it shall: a call ended meanwhile
};

bool RetiredObjects::Ripe(Object& object) noexcept {
    BarrierForAll();
    const std::lock_guard lock(mutex_);
    object.retired_ = current_epoch.fetch_add(1, std::memory_order_acq_rel) + 1;
    if (!objects_.first && !destroying_ && OldestCall(object.retired_, own_slot) == object.retired_) return true;
    Append(object);
    somebody_waits.store(true, std::memory_order_relaxed);
    BarrierForAll();    // who leaves from now on sees it
    return false;
}

void RetiredObjects::Append(Object& object) {
    Queue& queue = object.parent_ ? objects_ : environments_;
    object.next_ = nullptr;
    (queue.last ? queue.last->next_ : queue.first) = &object;
    queue.last = &object;
}

Object* RetiredObjects::TakeFirst(Queue& queue) {
    Object* object = queue.first;
    if (OldestCall(object->retired_, nullptr) != object->retired_) return nullptr;
    queue.first = std::exchange(object->next_, nullptr);
    if (!queue.first) queue.last = nullptr;
    return object;
}

Object* RetiredObjects::TakeRipe() {
    if (objects_.first) return TakeFirst(objects_);
    return environments_.first ? TakeFirst(environments_) : nullptr;
}

// One thread at a time, so that the order is kept, and outside of the lock, since destroying calls the application's
// memory functions.
void RetiredObjects::DestroyRipe() noexcept {
    std::unique_lock lock(mutex_);
    look_again_ = true;
    if (destroying_) return;
    destroying_ = true;
    while (std::exchange(look_again_, false)) {
        while (Object* object = TakeRipe()) {
            lock.unlock();
            {
                const SerialLock serial(*object);
                ObjectTree::DestroyTree(object);
            }
            lock.lock();
        }
    }
    destroying_ = false;
    somebody_waits.store(objects_.first || environments_.first, std::memory_order_relaxed);
}

namespace {

// Never destroyed: objects may be freed while the process ends.
RetiredObjects& Retired() {
    static auto* retired = new RetiredObjects;
    return *retired;
}

}  // namespace

namespace in_flight {

Slot& TakeSlot() noexcept {
    Slot* slot = FreeSlot();
    if (!slot) slot = NewSlot();
    slots_taken.fetch_add(1, std::memory_order_relaxed);
    std::atomic_thread_fence(std::memory_order_seq_cst);
    pthread_setspecific(SlotKey(), slot);
    own_slot = slot;
    return *slot;
}

bool MayDestroy(Object& object) noexcept { return Retired().Ripe(object); }

void DestroyRipe() noexcept { Retired().DestroyRipe(); }

}  // namespace in_flight
