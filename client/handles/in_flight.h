// Calls in flight. A thread may free an object while another is inside a call that works on it, and a callback may free
// what the calls around it work on: what is freed leaves the set of living objects at once, so that no later call finds
// it, but is destroyed only when every call that may know it has ended. Memory is back at once where no such call runs,
// and is never touched by a thread of the library's own.
//
// How it works. Time is counted in epochs: `current_epoch` grows with each object that is freed. An object carries the
// epoch in which it was born and the one, `retired`, that its end began. A thread shows in its slot the epoch in which
// its outermost call `entered`, and the `newest` epoch whose objects the call may know: any, as long as it may look
// objects up; the epoch of the moment, while it waits or works for long (LongCall) and looks up nothing.
//
// Rule: a call may know an object when   entered < retired  and  born <= newest.   While such a call runs the object
// waits in the list of that call's slot; when the call leaves, the next such call takes it over, and where there is
// none it is destroyed. One thread at a time destroys.
//
// Proof that a call which has found an object is always seen by whoever frees it. R frees the object: it takes it out
// of the set, makes the barrier B and then reads the slots. T finds it: it stores into its slot, makes a barrier of its
// own (Fence) and then reads the set.
//  1. T's call holds the object by having entered. B and T's Fence are sequentially consistent fences in effect
//     (below), so one comes first. If B does, T reads the set after the object was taken out and does not find it. Else
//     R reads `entered` after T stored it: it sees that call or a later one of T's. A later one means that the call has
//     ended.
//  2. entered < retired then. R makes `retired` by fetch_add after B and T read `entered` before its Fence: had T read
//     R's value or a later one, acquire and release would have ordered the taking out before T's look-up (acq_rel on
//     current_epoch, whose changes are one release sequence).
//  3. born <= newest. `born` was read from current_epoch before the object was put into the set (release); T found it
//     there (acquire) and read current_epoch for `newest` afterwards: reads of one atomic variable never go back.
//     Before and after that T shows kAny, stored before the Fence that precedes each further look-up, so that 1. holds
//     for `newest` as it does for `entered`. R reads `entered` first (acquire), so that a `newest` from before that
//     call is never taken for it: each call leaves kAny behind before it leaves.
//  4. What T did to the object happens before its end: T leaves with a release store that R, or whoever looks at the
//     slot next under the mutex, reads with acquire.
//  5. Nothing waits for ever: who leaves an object with a slot stores `keeps`, makes the barrier and looks whether a
//     call is still in; who leaves stores kOutside, fences and looks at `keeps`. One of the two sees the other. The
//     same holds for an object whose lock (SerialLock) is held when it is to be destroyed: nobody waits for the lock,
//     whose holder is in a call and looks, having given it up, whether an object waits.
// The barrier of R is the system's (membarrier), which makes every running thread fence: then a signal fence is enough
// for T, which is what makes entering cheap. Where the system has none both fence, and every thread is a guest.
//
// What a reader may hold, and until when. A pointer that Live gave: until the outermost CallInFlight of the thread
// ends, LongCalls and callbacks included. What hangs below such an object, or what it belongs to: as long, since those
// die with it or after it (an environment goes after the last of its objects). Pointers found elsewhere, such as in a
// server's list of sessions: as long as a lock is held that is also held while the object is destroyed (SerialLock).
//
// What is bounded: objects wait for calls that run, and for a LongCall only if they lived before it began (before the
// first free after it began, to be exact).
#pragma once

#include <atomic>
#include <cstdint>

class Object;

namespace in_flight {

using Epoch = std::uint64_t;
constexpr Epoch kOutside = 0;
constexpr Epoch kAny = ~Epoch{0};

// Objects that wait, the first freed first. Linked through the objects, so that waiting needs no memory.
struct Queue {
    Object* first = nullptr;
    Object* last = nullptr;
};

// What a thread shows to the others. Never freed: a thread that ends leaves its slot to the next.
struct alignas(64) Slot {
    std::atomic<Epoch> entered{kOutside};
    std::atomic<Epoch> newest{kAny};
    std::atomic<bool> keeps{false};    // something in `waiting`
    std::atomic<bool> taken{true};
    Queue waiting;                     // under the mutex of the retired objects
    Slot* next = nullptr;
};

// What a thread knows of itself. Without a slot, which takes memory and the system's barrier, it is a guest in one that all
// such threads share.
struct Own {
    Slot* slot = nullptr;
    unsigned depth = 0;           // calls within calls
    unsigned closed_depth = 0;    // the depth of the innermost LongCall; open above it
    Epoch closed_at = 0;          // its epoch
    bool gave_up_lock = false;    // that an object may be waiting for, which the end of the call looks into
};

extern constinit std::atomic<Epoch> current_epoch;
extern constinit std::atomic<bool> somebody_waits_for_a_lock;
[[gnu::tls_model("initial-exec")]] extern constinit thread_local Own own;

// The own side of the barrier, of a thread with a slot. Guests fence in earnest.
inline void Fence() noexcept { std::atomic_signal_fence(std::memory_order_seq_cst); }

inline Epoch Now() noexcept { return current_epoch.load(std::memory_order_acquire); }

// Whether the calling thread is in a LongCall and shows that it looks nothing up.
inline bool Closed() noexcept { return own.closed_depth != 0 && own.closed_depth == own.depth; }

// The calling thread, being closed, has got to know objects: it shows so.
inline void Close() noexcept {
    own.closed_at = Now();
    own.slot->newest.store(own.closed_at, std::memory_order_release);
}
inline void Open() noexcept {
    own.slot->newest.store(kAny, std::memory_order_release);
    Fence();
}

void EnterSlowly() noexcept;
void LeaveSlowly() noexcept;
void HandBack(Slot& slot) noexcept;

// A lock that destroying an object needs was given up.
inline void GaveUpLock() noexcept {
    if (own.slot) Fence();
    else std::atomic_thread_fence(std::memory_order_seq_cst);
    if (somebody_waits_for_a_lock.load(std::memory_order_relaxed)) own.gave_up_lock = true;
}

// Takes an object that no call finds any more and that hangs below nothing: destroys it with all below it, at once or
// when the last call that may know it has ended.
void Retire(Object& object) noexcept;

// For other things that calls read without a lock, and only while they look up: an epoch after which no call comes upon
// what was taken away before, and whether all calls from before it have ended.
Epoch Retire() noexcept;
bool AllLeft(Epoch retired) noexcept;

}  // namespace in_flight

// Held by every exported function while it may touch an object. Calls nest: functions of the application's may call the
// library.
class CallInFlight {
public:
    CallInFlight() noexcept {
        using namespace in_flight;
        if (own.depth != 0 || !own.slot) [[unlikely]] {
            EnterSlowly();
            return;
        }
        own.depth = 1;
        own.slot->entered.store(Now(), std::memory_order_release);
        Fence();
    }
    ~CallInFlight() {
        using namespace in_flight;
        if (own.depth != 1 || !own.slot) [[unlikely]] {
            LeaveSlowly();
            return;
        }
        own.depth = 0;
        own.slot->entered.store(kOutside, std::memory_order_release);
        Fence();
        if (own.slot->keeps.load(std::memory_order_relaxed) || own.gave_up_lock) [[unlikely]] HandBack(*own.slot);
    }
    CallInFlight(const CallInFlight&) = delete;
    CallInFlight& operator=(const CallInFlight&) = delete;
};

// Held inside a call around what may take long: a wait, a query, a transfer. What others make and free meanwhile does
// not wait for this call. Everything that the call knew before stays valid, as does what it looks up or makes inside:
// Live and Create take care of that, and callbacks may call the library. Costs two stores and a load; nests; does
// nothing outside of calls.
class LongCall {
public:
    LongCall() noexcept : before_(in_flight::own.closed_depth) {
        using namespace in_flight;
        if (own.depth == 0 || !own.slot) return;
        own.closed_depth = own.depth;
        Close();
    }
    ~LongCall() {
        using namespace in_flight;
        if (own.closed_depth == before_) return;
        own.closed_depth = before_;
        Open();
    }
    LongCall(const LongCall&) = delete;
    LongCall& operator=(const LongCall&) = delete;

private:
    unsigned before_;
};
