// Environments: mode, memory, and the texts between the application's form and UTF-8. An environment owns every object
// made in it; freeing it frees them all.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <mutex>
#include <string>
#include <string_view>

#include "handles/character_set.h"
#include "handles/error_handle.h"
#include "handles/kept.h"
#include "handles/status.h"

// The application's memory functions; all null: the library's own.
struct MemoryFunctions {
    void* context = nullptr;
    void* (*allocate)(void* context, std::size_t size) = nullptr;
    void (*release)(void* context, void* memory) = nullptr;
};

class Environment : public Object {
public:
    static constexpr Kind kKind = Kind::environment;

    [[nodiscard]] const MemoryFunctions& Memory() const { return memory_; }

    // The application's character sets: of texts, and of national ones.
    struct CharacterSets {
        const CharacterSet* text;
        const CharacterSet* national;
    };
    // UTF-8, or by the mode UTF-16, for both.
    static CharacterSets SetsOf(std::uint32_t mode);

    // Null when memory fails. The environment lies in memory of the functions given.
    static Environment* Open(std::uint32_t mode, const CharacterSets& sets, const MemoryFunctions& memory,
                             std::size_t extra) noexcept;

    [[nodiscard]] std::uint32_t Mode() const { return mode_; }
    [[nodiscard]] const CharacterSets& Sets() const { return sets_; }
    [[nodiscard]] bool Converts() const { return converts_; }    // texts are not UTF-8
    [[nodiscard]] bool Utf16() const { return utf16_; }          // their units have two bytes
    [[nodiscard]] bool Threaded() const { return threaded_; }
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    // Memory that lives at most as long as the environment: zeroed, 16-byte aligned, counted. Throws std::bad_alloc.
    void* Allocate(std::size_t size);
    void Release(void* memory) noexcept;    // null is harmless
    [[nodiscard]] std::uint64_t HeapBytes() const { return heap_bytes_.load(std::memory_order_relaxed); }

    const Birth birth;
    ErrorList errors;    // the records of calls without an error handle
    std::atomic<const char*> last_call{nullptr};    // the name of the last of these; null: none yet

    // Kept for the application, without effect here.
    std::uint32_t cache_optimal_size = 8388608;
    std::uint32_t cache_maximal_excess = 10;    // per cent
    std::uint16_t pin_option = 1;
    std::uint16_t allocation_duration = 10;
    std::uint16_t pin_duration = 10;

private:
    friend class ObjectTree;
    friend class RetiredObjects;
    Environment(const Origin& origin, std::uint32_t mode, const CharacterSets& sets, const MemoryFunctions& memory);

    void Close() noexcept;    // the end of its own memory

    std::uint32_t mode_;
    CharacterSets sets_;
    bool converts_;
    bool utf16_;
    bool threaded_;
    std::atomic<std::uint64_t> heap_bytes_{0};    // of what Allocate gave and Release did not get back
    MemoryFunctions memory_;
    std::mutex tree_mutex_;              // links between this environment's objects
    std::uint64_t freed_objects_ = 0;    // not destroyed yet; under the mutex of the retired objects, as the next
    bool freed_ = false;                 // it is itself, and waits for them
};

inline SerialLock::SerialLock(Object& object) {
    if (object.Env().Threaded()) LockThreaded(object);
}

// Blocks the library holds in all environments.
std::int64_t HeldBlocks() noexcept;

// What OCIInitialize recorded for OCIEnvInit.
struct ProcessDefaults {
    std::uint32_t mode = 0;
    MemoryFunctions memory;
};
void SetProcessDefaults(const ProcessDefaults& defaults);
ProcessDefaults GetProcessDefaults();

// A text of the application's as UTF-8. UTF-8 is borrowed, not copied; other sets are converted. `length` counts bytes.
// What is no text in the set (in UTF-16 an odd length, half a pair) makes Valid false: error 24501.
class TextIn {
public:
    TextIn(const Environment& environment, const void* text, std::size_t length);
    [[nodiscard]] std::string_view View() const { return view_; }
    [[nodiscard]] bool Valid() const { return valid_; }

private:
    std::string converted_;
    std::string_view view_;
    bool valid_ = true;
};

// UTF-8 to a form that the application reads: itself, or the environment's set in `converted`, where '?'
// stands for what the set lacks. The view is bytes.
std::string_view TextOut(const Environment& environment, std::string_view utf8, std::string& converted);

// Puts a text into the application's buffer, cut to whole characters and closed with a zero (two in UTF-16). False when
// it was cut; nothing is written into a buffer that has no room for the zero.
bool TextToBuffer(const Environment& environment, std::string_view utf8, void* buffer, std::size_t size);

// The bytes of a zero-terminated text of the application's.
std::size_t TextLength(const Environment& environment, const void* text);
