// Calls in flight. A thread may free an object while another is inside a call that works on it: what is freed leaves the
// set of living objects at once, so that no later call finds it, but is destroyed only when every call that was running
// then has ended.
//
// Entering and leaving are plain stores into the thread's own slot; who frees pays for the ordering.
#pragma once

class Object;

// Held by every exported function while it may touch an object. Calls nest: memory functions of the application's may
// call the library.
class CallInFlight {
public:
    CallInFlight() noexcept;
    ~CallInFlight();
    CallInFlight(const CallInFlight&) = delete;
    CallInFlight& operator=(const CallInFlight&) = delete;
};

namespace in_flight {

// Asked about an object that no call finds any more: true when no other thread is inside a call. Else the object is kept,
// and destroyed by the thread that leaves last.
bool MayDestroy(Object& object) noexcept;

}  // namespace in_flight
