// Calls in flight. A thread may free an object while another is inside a call that works on it: what is freed leaves
// the set of living objects at once, so that no later call finds it, but is destroyed only when every call that was
// running then has ended.
//
// Entering and leaving are plain stores into the thread's own slot; who frees pays for the ordering.
#pragma once

#include <atomic>
#include <cstdint>

class Object;

namespace in_flight {

using Epoch = std::uint64_t;
constexpr Epoch kOutside = 0;

// What a thread shows to the others. Never freed: a thread that ends leaves its slot to the next.
struct alignas(64) Slot {
    std::atomic<Epoch> entered{kOutside};
    std::atomic<bool> taken{true};
    unsigned depth = 0;    // the owner's: calls within calls
    Slot* next = nullptr;
};

extern constinit std::atomic<Epoch> current_epoch;
extern constinit std::atomic<bool> somebody_waits;    // retired objects do
extern const bool system_barrier;
[[gnu::tls_model("initial-exec")]] extern constinit thread_local Slot* own_slot;

Slot& TakeSlot() noexcept;
void DestroyRipe() noexcept;

// Asked about an object that no call finds any more: true when no other thread is inside a call. Else the object is
// kept, and destroyed by the thread that leaves last. What leads to an object beside the set of living ones, such as a
// server's list of its sessions, needs a lock that is held while the object is destroyed (SerialLock).
bool MayDestroy(Object& object) noexcept;

}  // namespace in_flight

// Held by every exported function while it may touch an object. Calls nest: memory functions of the application's may
// call the library.
class CallInFlight {
public:
    CallInFlight() noexcept : slot_(in_flight::own_slot ? *in_flight::own_slot : in_flight::TakeSlot()) {
        if (slot_.depth++ > 0) return;
        slot_.entered.store(in_flight::current_epoch.load(std::memory_order_acquire), std::memory_order_release);
        if (in_flight::system_barrier) std::atomic_signal_fence(std::memory_order_seq_cst);
        else std::atomic_thread_fence(std::memory_order_seq_cst);
    }
    ~CallInFlight() {
        if (--slot_.depth > 0) return;
        slot_.entered.store(in_flight::kOutside, std::memory_order_release);
        if (!in_flight::system_barrier) std::atomic_thread_fence(std::memory_order_seq_cst);
        if (in_flight::somebody_waits.load(std::memory_order_relaxed)) in_flight::DestroyRipe();
    }
    CallInFlight(const CallInFlight&) = delete;
    CallInFlight& operator=(const CallInFlight&) = delete;

private:
    in_flight::Slot& slot_;
};
