// Calls in flight: threads and their slots, and the objects that wait for calls to end. How it hangs together, and the
// proof, are in the header.
#include "handles/in_flight.h"

#include <linux/membarrier.h>
#include <pthread.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <cstdint>
#include <mutex>
#include <new>
#include <type_traits>
#include <utility>

#include "handles/environment.h"

namespace in_flight {

constinit std::atomic<Epoch> current_epoch{1};
constinit std::atomic<bool> somebody_waits_for_a_lock{false};
[[gnu::tls_model("initial-exec")]] constinit thread_local Own own;

}  // namespace in_flight

namespace {

using namespace in_flight;

bool RegisterBarrier() { return syscall(SYS_membarrier, MEMBARRIER_CMD_REGISTER_PRIVATE_EXPEDITED, 0, 0) == 0; }
const bool system_barrier = RegisterBarrier();

// The slot of the threads that have none of their own. They count themselves, and fence.
constinit Slot guest_slot;
constinit std::mutex guest_mutex;
constinit unsigned guests = 0;

constinit std::atomic<Slot*> slots{&guest_slot};
constinit std::atomic<unsigned> slots_taken{0};

// Orders what this thread did before against what every running thread does after.
void BarrierForAll() {
    std::atomic_thread_fence(std::memory_order_seq_cst);
    if (system_barrier && slots_taken.load(std::memory_order_relaxed) > 1) {
        syscall(SYS_membarrier, MEMBARRIER_CMD_PRIVATE_EXPEDITED, 0, 0);
    }
}

// ---- Slots of threads

Slot* FreeSlot() {
    for (Slot* slot = slots.load(std::memory_order_acquire); slot; slot = slot->next) {
        if (!slot->taken.exchange(true, std::memory_order_acq_rel)) return slot;
    }
    return nullptr;
}

Slot* NewSlot() {
    auto* slot = new (std::nothrow) Slot;
    if (!slot) return nullptr;
    slot->next = slots.load(std::memory_order_relaxed);
    while (!slots.compare_exchange_weak(slot->next, slot, std::memory_order_acq_rel)) {}
    return slot;
}

void GiveUpSlot(void* given) {
    auto* slot = static_cast<Slot*>(given);
    own.slot = nullptr;
    slots_taken.fetch_sub(1, std::memory_order_relaxed);
    slot->taken.store(false, std::memory_order_release);
}

// The system's thread-specific data outlives the language's, as the values of the thread package's keys do.
struct SlotKey {
    pthread_key_t key{};
    const bool made = pthread_key_create(&key, GiveUpSlot) == 0;
};

// Gives the thread a slot until it ends. False when there is no memory for it, or no barrier.
bool TakeSlot() {
    static const SlotKey key;
    const bool can = key.made && system_barrier;
    Slot* slot = can ? FreeSlot() : nullptr;
    if (!slot && can) slot = NewSlot();
    if (!slot) return false;
    slots_taken.fetch_add(1, std::memory_order_relaxed);
    std::atomic_thread_fence(std::memory_order_seq_cst);    // who misses the count is seen by our look-ups
    own.slot = slot;
    if (pthread_setspecific(key.key, slot) == 0) return true;
    GiveUpSlot(slot);
    return false;
}

// Guests show the epoch in which the first of those that are in entered.
void EnterAsGuest() {
    const std::lock_guard lock(guest_mutex);
    if (guests++ == 0) guest_slot.entered.store(Now(), std::memory_order_release);
    std::atomic_thread_fence(std::memory_order_seq_cst);
}

void LeaveAsGuest() {
    {
        const std::lock_guard lock(guest_mutex);
        if (--guests > 0) return;
        guest_slot.entered.store(kOutside, std::memory_order_release);
        std::atomic_thread_fence(std::memory_order_seq_cst);
    }
    if (guest_slot.keeps.load(std::memory_order_relaxed) || own.gave_up_lock) HandBack(guest_slot);
}

}  // namespace

// ---- Retired objects

// The objects that wait; all under one mutex, which is not held while anything is destroyed.
class RetiredObjects {
public:
    void Retire(Object& object) noexcept;
    void HandBack(Slot& slot) noexcept;

private:
    using Lock = std::unique_lock<std::mutex>;

    static void Append(Queue& queue, Object& object) noexcept;
    static Object* TakeFirst(Queue& queue) noexcept;
    static bool OwnCallMayKnow(const Object& object) noexcept;
    static bool MayKnow(const Slot& slot, const Object& object) noexcept;
    static Slot* FindKnowing(const Object& object) noexcept;
    static bool LeaveWith(Slot& slot, Object& object) noexcept;
    static bool LeaveWithWhoKnows(Object& object) noexcept;
    static bool DestroyUnlessBusy(Object& object) noexcept;
    void DestroyRipe(Lock& lock) noexcept;
    bool TryBusyAgain() noexcept;
    void Finish(Object* environment) noexcept;

    std::mutex mutex_;
    Queue ripe_;                 // nobody knows them; empty unless some thread destroys
    Queue busy_;                 // nor these, but another call holds their lock
    bool destroying_ = false;
    bool look_again_ = false;    // at the busy ones: a lock was given up while some thread destroyed
};

namespace {

constinit RetiredObjects retired_objects;
static_assert(std::is_trivially_destructible_v<RetiredObjects>, "objects may be freed while the process ends");

bool IsEnvironment(const Object& object) { return !object.Parent(); }

}  // namespace

void RetiredObjects::Append(Queue& queue, Object& object) noexcept {
    (queue.last ? queue.last->next_ : queue.first) = &object;
    queue.last = &object;
}

Object* RetiredObjects::TakeFirst(Queue& queue) noexcept {
    Object* object = queue.first;
    if (!object) return nullptr;
    queue.first = std::exchange(object->next_, nullptr);
    if (!queue.first) queue.last = nullptr;
    return object;
}

// The outermost call may destroy what it has itself taken away. The calls around an inner one know what they knew when
// they called out; a LongCall says until when that was.
bool RetiredObjects::OwnCallMayKnow(const Object& object) noexcept {
    if (own.depth == 0) return false;
    if (own.closed_depth == 0) return own.depth > 1;
    return own.depth != own.closed_depth + 1 || object.born_ <= own.closed_at;
}

bool RetiredObjects::MayKnow(const Slot& slot, const Object& object) noexcept {
    if (&slot == own.slot) return OwnCallMayKnow(object);
    const Epoch entered = slot.entered.load(std::memory_order_acquire);
    return entered != kOutside && entered < object.retired_ &&
           object.born_ <= slot.newest.load(std::memory_order_acquire);
}

Slot* RetiredObjects::FindKnowing(const Object& object) noexcept {
    for (Slot* slot = slots.load(std::memory_order_acquire); slot; slot = slot->next) {
        if (MayKnow(*slot, object)) return slot;
    }
    return nullptr;
}

// False when the slot's call has ended meanwhile, and may not have seen that it is to hand back.
bool RetiredObjects::LeaveWith(Slot& slot, Object& object) noexcept {
    Append(slot.waiting, object);
    if (slot.keeps.exchange(true, std::memory_order_relaxed)) return true;
    BarrierForAll();
    if (slot.entered.load(std::memory_order_acquire) != kOutside) return true;
    slot.keeps.store(false, std::memory_order_relaxed);
    TakeFirst(slot.waiting);
    return false;
}

bool RetiredObjects::LeaveWithWhoKnows(Object& object) noexcept {
    while (Slot* slot = FindKnowing(object)) {
        if (LeaveWith(*slot, object)) return true;
    }
    return false;
}

// An environment goes after the last object of its own that was freed apart from it.
void RetiredObjects::Retire(Object& object) noexcept {
    BarrierForAll();
    Lock lock(mutex_);
    object.retired_ = current_epoch.fetch_add(1, std::memory_order_acq_rel) + 1;
    Environment& environment = object.Env();
    if (!IsEnvironment(object)) {
        ++environment.freed_objects_;
    } else if (environment.freed_objects_ > 0) {
        environment.freed_ = true;
        return;
    }
    if (LeaveWithWhoKnows(object)) return;
    if (destroying_) return Append(ripe_, object);
    destroying_ = true;
    Object* const owner = IsEnvironment(object) ? nullptr : &environment;
    lock.unlock();
    ObjectTree::DestroyTree(&object);
    lock.lock();
    destroying_ = false;
    Finish(owner);
    // What others have left here is not destroyed in the middle of this call, which may hold its lock.
    if (own.depth == 0) return DestroyRipe(lock);
    while (Object* ripe = TakeFirst(ripe_)) LeaveWith(own.slot ? *own.slot : guest_slot, *ripe);
}

void RetiredObjects::Finish(Object* owner) noexcept {
    if (!owner) return;
    auto& environment = static_cast<Environment&>(*owner);
    if (--environment.freed_objects_ > 0 || !environment.freed_) return;
    if (!LeaveWithWhoKnows(environment)) Append(ripe_, environment);
}

// A lock that is held is waited for by nobody: its holder is in a call, at whose end the object is looked at again.
bool RetiredObjects::DestroyUnlessBusy(Object& object) noexcept {
    const SerialLock serial(object, std::try_to_lock);
    if (!serial.Owns()) return false;
    ObjectTree::DestroyTree(&object);
    return true;
}

// By one thread at a time, since what an object's end does to others is not guarded against theirs; the mutex is given
// up, since destroying calls the application's memory functions.
void RetiredObjects::DestroyRipe(Lock& lock) noexcept {
    if (destroying_) return;
    destroying_ = true;
    do {
        while (Object* object = TakeFirst(ripe_)) {
            Object* const owner = IsEnvironment(*object) ? nullptr : &object->Env();
            lock.unlock();
            const bool destroyed = DestroyUnlessBusy(*object);
            lock.lock();
            if (destroyed) Finish(owner);
            else Append(busy_, *object);
        }
    } while (TryBusyAgain());
    destroying_ = false;
}

// Whether there are some to try. A lock's holder may have given it up before it could see that something waits.
bool RetiredObjects::TryBusyAgain() noexcept {
    const bool known = somebody_waits_for_a_lock.exchange(busy_.first, std::memory_order_relaxed);
    const bool again = std::exchange(look_again_, false);
    if (!busy_.first || (known && !again)) return false;
    if (!known) BarrierForAll();
    ripe_ = std::exchange(busy_, {});
    return true;
}

void RetiredObjects::HandBack(Slot& slot) noexcept {
    Lock lock(mutex_);
    slot.keeps.store(false, std::memory_order_relaxed);
    Queue waiting = std::exchange(slot.waiting, {});
    while (Object* object = TakeFirst(waiting)) {
        if (!LeaveWithWhoKnows(*object)) Append(ripe_, *object);
    }
    if (std::exchange(own.gave_up_lock, false)) {
        while (Object* object = TakeFirst(busy_)) Append(ripe_, *object);
        look_again_ = destroying_;
    }
    DestroyRipe(lock);
}

namespace in_flight {

void EnterSlowly() noexcept {
    if (Closed()) Open();
    if (own.depth++ > 0) return;
    if (!TakeSlot()) return EnterAsGuest();
    own.slot->entered.store(Now(), std::memory_order_release);
    Fence();
}

void LeaveSlowly() noexcept {
    if (--own.depth == 0) return LeaveAsGuest();
    if (Closed()) Close();
}

void Retire(Object& object) noexcept { retired_objects.Retire(object); }

void HandBack(Slot& slot) noexcept { retired_objects.HandBack(slot); }

Epoch Retire() noexcept {
    BarrierForAll();
    return current_epoch.fetch_add(1, std::memory_order_acq_rel) + 1;
}

// A LongCall looks nothing up: it comes upon what is there when it is open again.
bool AllLeft(Epoch retired) noexcept {
    for (const Slot* slot = slots.load(std::memory_order_acquire); slot; slot = slot->next) {
        const Epoch entered = slot->entered.load(std::memory_order_acquire);
        const bool open = slot->newest.load(std::memory_order_acquire) == kAny;
        if (slot != own.slot && entered != kOutside && entered < retired && open) return false;
    }
    return true;
}

}  // namespace in_flight
