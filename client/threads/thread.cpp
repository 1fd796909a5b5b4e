// Threads. Each thread of the process that meets the package gets a record: who it is, and its values of keys. A record
// is its thread's alone. It ends by the system's own thread-specific data, whose destructor runs when a thread ends,
// but not for the main thread when the process does.
#include "threads/thread.h"

#include "handles/errors.h"

#include <pthread.h>

#include <algorithm>
#include <system_error>
#include <utility>
#include <vector>

namespace {

Status Misuse(const char* what) { return Error(errors::kNullArgument, what); }

std::atomic<std::uint64_t> last_number{0};

struct KeyValue {
    std::shared_ptr<KeyState> key;
    void* value;
};

class ThreadRecord {
public:
    explicit ThreadRecord(std::shared_ptr<ThreadState> state) : state_(std::move(state)) {}
    ThreadRecord(const ThreadRecord&) = delete;
    ThreadRecord& operator=(const ThreadRecord&) = delete;

    // Who waits for the thread goes on.
    ~ThreadRecord() {
        const std::lock_guard lock(state_->mutex);
        state_->ended = true;
        state_->ended_condition.notify_all();
    }

    [[nodiscard]] const std::shared_ptr<ThreadState>& State() const { return state_; }

    void Set(const std::shared_ptr<KeyState>& key, void* value) {
        const auto found = Find(*key);
        if (found != values_.end()) {
            found->value = value;
            return;
        }
        std::erase_if(values_, [](const KeyValue& old) { return !old.key->alive; });
        values_.push_back({key, value});
    }

    void* Get(const KeyState& key) {
        const auto found = Find(key);
        return found == values_.end() ? nullptr : found->value;
    }

    // The functions called may set values anew: a few rounds, then no more.
    void DestroyValues() {
        constexpr int kRounds = 4;
        for (int round = 0; round < kRounds && !values_.empty(); ++round) {
            for (const KeyValue& old : std::exchange(values_, {})) {
                if (old.value && old.key->destroy && old.key->alive) old.key->destroy(old.value);
            }
        }
    }

private:
    std::vector<KeyValue>::iterator Find(const KeyState& key) {
        return std::find_if(values_.begin(), values_.end(),
                            [&key](const KeyValue& value) { return value.key.get() == &key; });
    }

    std::shared_ptr<ThreadState> state_;
    std::vector<KeyValue> values_;
};

constinit thread_local ThreadRecord* own_record = nullptr;

// The functions of keys may use the package: the record stands until they are done.
void EndRecord(void* given) {
    const std::unique_ptr<ThreadRecord> record(static_cast<ThreadRecord*>(given));
    own_record = record.get();
    record->DestroyValues();
    own_record = nullptr;
}

struct RecordKey {
    pthread_key_t key{};
    const bool made = pthread_key_create(&key, EndRecord) == 0;
};

// False, without the memory for it, when the thread's end will not end the record.
bool AttachRecord(ThreadRecord& record) {
    static const RecordKey key;
    if (!key.made || pthread_setspecific(key.key, &record) != 0) return false;
    own_record = &record;
    return true;
}

std::shared_ptr<ThreadState> NewState() {
    auto state = std::make_shared<ThreadState>();
    state->number = last_number.fetch_add(1) + 1;
    return state;
}

ThreadRecord& CurrentRecord() {
    if (own_record) return *own_record;
    auto record = std::make_unique<ThreadRecord>(NewState());
    if (!AttachRecord(*record)) throw std::bad_alloc();
    return *record.release();
}

struct Start {
    void (*routine)(void* argument);
    void* argument;
    std::unique_ptr<ThreadRecord> record;
};

void* RunThread(void* given) {
    std::unique_ptr<Start> start(static_cast<Start*>(given));
    ThreadRecord* record = start->record.release();
    const bool attached = AttachRecord(*record);
    own_record = record;
    start->routine(start->argument);
    if (!attached) EndRecord(record);
    return nullptr;
}

// Answers the system's error, 0 when the thread has taken over what it was given.
int StartDetached(std::unique_ptr<Start>& start) {
    pthread_attr_t detached;
    pthread_attr_init(&detached);
    pthread_attr_setdetachstate(&detached, PTHREAD_CREATE_DETACHED);
    pthread_t thread{};
    const int failed = pthread_create(&thread, &detached, RunThread, start.get());
    pthread_attr_destroy(&detached);
    if (!failed) start.release();
    return failed;
}

}  // namespace

const std::shared_ptr<ThreadState>& CurrentThread() { return CurrentRecord().State(); }

Status ThreadMutex::Acquire() {
    const std::uint64_t self = CurrentThread()->number;
    std::unique_lock lock(guard_);
    if (owner_ == self) return Misuse("the mutex is held by this thread already");
    const LongCall wait;
    released_.wait(lock, [this] { return owner_ == 0; });
    owner_ = self;
    return {};
}

Status ThreadMutex::Release() {
    const std::uint64_t self = CurrentThread()->number;
    const std::lock_guard lock(guard_);
    if (owner_ != self) return Misuse("the mutex is not held by this thread");
    owner_ = 0;
    released_.notify_one();
    return {};
}

Status ThreadMutex::CheckFree() {
    const std::lock_guard lock(guard_);
    return owner_ == 0 ? Status() : Misuse("the mutex is held");
}

ThreadKey::ThreadKey(const Origin& origin, void (*destroy)(void* value))
    : Object(origin), state_(std::make_shared<KeyState>(destroy)) {}

ThreadKey::~ThreadKey() { state_->alive = false; }

void ThreadKey::Set(void* value) { CurrentRecord().Set(state_, value); }

void* ThreadKey::Get() const { return CurrentRecord().Get(*state_); }

std::shared_ptr<ThreadState> ThreadHandle::Set(std::shared_ptr<ThreadState> state) {
    const std::lock_guard lock(mutex_);
    return std::exchange(state_, std::move(state));
}

std::shared_ptr<ThreadState> ThreadHandle::State() {
    const std::lock_guard lock(mutex_);
    return state_;
}

Status ThreadHandle::Join() {
    const std::shared_ptr<ThreadState> state = State();
    if (!state) return Misuse("the handle has no thread");
    if (state == CurrentThread()) return Misuse("a thread cannot join itself");
    std::unique_lock lock(state->mutex);
    if (state->joined) return Misuse("the thread is joined already");
    state->joined = true;
    const LongCall wait;
    state->ended_condition.wait(lock, [&state] { return state->ended; });
    return {};
}

Status ThreadHandle::Close() {
    const std::lock_guard lock(mutex_);
    if (!state_) return Misuse("the handle has no thread");
    state_.reset();
    return {};
}

Status StartThread(void (*routine)(void* argument), void* argument, ThreadId* id, ThreadHandle* handle) {
    std::shared_ptr<ThreadState> state = NewState();
    auto start = std::make_unique<Start>(Start{routine, argument, std::make_unique<ThreadRecord>(state)});
    const std::uint64_t old_number = id ? id->number.exchange(state->number) : 0;
    std::shared_ptr<ThreadState> old_state = handle ? handle->Set(std::move(state)) : nullptr;
    if (const int failed = StartDetached(start)) {
        if (id) id->number = old_number;
        if (handle) handle->Set(std::move(old_state));
        return Error(errors::kCannotStart, std::system_category().message(failed));
    }
    return {};
}
