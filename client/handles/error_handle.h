// Error records: number, SQLSTATE and text of what a call had to say. They hang on an error handle or an environment.
#pragma once

#include <atomic>
#include <cstdint>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "handles/object.h"
#include "handles/status.h"

// The short published wording of a number, without its prefix; a general one for numbers that have none.
std::string_view ErrorText(int number) noexcept;
// The five characters of its SQLSTATE.
std::string_view SqlState(int number) noexcept;
// "[KELP/<ENGINE>] ORA-nnnnn: <text>", then ": " and the engine's own words where it had some, and a line feed.
std::string ErrorMessage(int number, std::string_view engine, std::string_view detail);

// The records of the last call. Recording formats nothing: texts are put together when they are asked for. The first
// record always finds room. Threads that share a list see each other's records, but nothing worse.
class ErrorList {
public:
    struct Record {
        int number;
        const char* engine;
        std::string detail;
    };

    void Clear() noexcept {
        const int state = state_.load(std::memory_order_relaxed);
        if (state == kListed) [[unlikely]] Empty();
        else if (state != kNone) state_.store(kNone, std::memory_order_relaxed);
    }
    // Nothing for a status without a number. Without memory a further record is lost.
    void Add(const Status& status) noexcept {
        if (status.Number() == 0) return;
        if (status.Plain() && state_.load(std::memory_order_relaxed) == kNone) {
            state_.store(status.Number(), std::memory_order_relaxed);
        } else {
            List(status);
        }
    }
    void TakeFrom(ErrorList& other) noexcept;
    // The record at a position, from 1; nothing beyond the last. A copy: throws std::bad_alloc.
    [[nodiscard]] std::optional<Record> At(std::size_t position) const;

private:
    void Empty() noexcept;
    void List(const Status& status) noexcept;

    // Most calls leave no record, and most that do leave a plain one: neither locks anything.
    static constexpr int kNone = 0;
    static constexpr int kListed = -1;
    static constexpr int kSpare = -2;    // the only record is spare_
    std::atomic<int> state_{kNone};    // or the number of the only record, a plain one
    mutable std::mutex mutex_;
    std::vector<Record> records_;    // when listed
    Status spare_;                   // kept where memory was short for a list
};

class ErrorHandle : public Object {
public:
    static constexpr Kind kKind = Kind::error;

    // A row that failed in batch-error mode.
    struct RowFailure {
        std::uint32_t row;    // from 0
        Status status;
    };

    explicit ErrorHandle(const Origin& origin) : Object(origin) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    // A call begins.
    void Begin(const char* function) noexcept {
        last_call.store(function, std::memory_order_relaxed);
        list.Clear();
    }

    ErrorList list;
    std::atomic<const char*> last_call{nullptr};    // the function's name; null: none yet
    // Set by an execute and kept until the next one through this handle, not emptied by other calls.
    std::vector<RowFailure> row_failures;
    std::uint32_t row_offset = 0;    // OCI_ATTR_DML_ROW_OFFSET
};
