// The thread package: mutexes, keys, identifiers, handles and threads. Everything here may be used from any thread at
// any time: an object that is destroyed while another thread is in a call on it lives until that call has ended. A held
// mutex that goes with its environment leaves those who wait for it waiting.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <memory>
#include <mutex>

#include "handles/object.h"
#include "handles/status.h"

// A thread as others see it; number 0 is no thread's.
struct ThreadState {
    std::uint64_t number = 0;
    std::mutex mutex;
    std::condition_variable ended_condition;
    bool ended = false;
    bool joined = false;
};

// The state of the thread that asks.
const std::shared_ptr<ThreadState>& CurrentThread();

// Not recursive: what its owner may not do again is an error (21560) and no deadlock.
class ThreadMutex : public Object {
public:
    static constexpr Kind kKind = Kind::thread_mutex;
    explicit ThreadMutex(const Origin& origin) : Object(origin) {}

    Status Acquire();
    Status Release();      // by the owner alone
    Status CheckFree();    // error 21560 while it is held

private:
    std::mutex guard_;
    std::condition_variable released_;
    std::uint64_t owner_ = 0;    // number of the thread that holds it
};

// What a key is to the threads that have a value for it; lives as long as one has.
struct KeyState {
    explicit KeyState(void (*function)(void* value)) : destroy(function) {}

    void (*const destroy)(void* value);    // null: none
    std::atomic<bool> alive{true};
};

// A value for each thread, at first null. When a thread ends with a value, the key's function is called with it; the
// main thread does not end before the process.
class ThreadKey : public Object {
public:
    static constexpr Kind kKind = Kind::thread_key;
    ThreadKey(const Origin& origin, void (*destroy)(void* value));
    ~ThreadKey() override;

    void Set(void* value);    // throws std::bad_alloc
    [[nodiscard]] void* Get() const;

private:
    std::shared_ptr<KeyState> state_;
};

class ThreadId : public Object {
public:
    static constexpr Kind kKind = Kind::thread_id;
    explicit ThreadId(const Origin& origin) : Object(origin) {}

    std::atomic<std::uint64_t> number{0};
};

class ThreadHandle : public Object {
public:
    static constexpr Kind kKind = Kind::thread_handle;
    explicit ThreadHandle(const Origin& origin) : Object(origin) {}

    // Answers what it had.
    std::shared_ptr<ThreadState> Set(std::shared_ptr<ThreadState> state);
    Status Join();     // error 21560 when there is no thread, it is the one that asks, or somebody joined it
    Status Close();    // error 21560 when there is no thread

private:
    std::shared_ptr<ThreadState> State();

    std::mutex mutex_;
    std::shared_ptr<ThreadState> state_;
};

// Starts a thread that runs `start(argument)`. Identifier and handle, which may be null, are set before it runs.
Status StartThread(void (*start)(void* argument), void* argument, ThreadId* id, ThreadHandle* handle);
