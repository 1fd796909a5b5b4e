// Values that go in pieces, on their way: what the pieces of one make, and what of one is still to be handed out. Short
// values are held in memory; long ones lie in large objects, and no more of them is read than goes at a time.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "engine/lobs.h"
#include "values/conversion.h"

class DataArea;

struct WholeValue {
    std::string bytes;                      // in the application's form
    std::shared_ptr<engine::Lob> object;    // instead of those: as the engine keeps it
    bool is_null = true;
    bool is_given = false;                  // by the step that runs

    void Forget() noexcept { bytes.clear(), object = nullptr, is_null = true; }
};

// Puts pieces together. What fails answers an error's number, and ends the value.
class PieceCollector {
public:
    // Where long values go; null, or one that takes no objects: nowhere.
    void Use(engine::LobStore* store) { store_ = store && store->TakesObjects() ? store : nullptr; }
    int Append(const DataArea& area, WholeValue& whole, std::string_view piece, bool begins, bool last);

private:
    int Write(const DataArea& area, engine::Lob& object, std::string_view piece, bool last);

    engine::LobStore* store_ = nullptr;
    std::uint64_t length_ = 0;    // of the value so far
    bool closed_ = false;         // its zero has come
    std::string torn_;            // what the last piece began of a character
};

// A value that is handed out.
class OutgoingValue {
public:
    // Whether a define or bind takes pieces of a large object as they are read. Others get the value whole.
    static bool Streams(const DataArea& area, engine::LobKind kind);

    void Start(std::string_view whole) {
        rest = whole;
        whole_ = whole.size();
        object_ = nullptr;
    }
    void Start(std::shared_ptr<engine::Lob> object);    // one of those that stream
    // Has more of a value that does not end at hand, when nothing is. Answers an error's number or 0.
    int Refill(DataArea& area) { return rest.empty() ? ReadMore(area) : 0; }

    [[nodiscard]] bool Ends() const { return rest.empty() && !object_; }
    [[nodiscard]] bool IsAtHand() const { return !object_; }    // all that is left of it
    [[nodiscard]] std::int16_t CutIndicator() const;    // for one of which not all is taken
    std::string_view rest;    // in the application's form, at hand: views what was given, or the area's workspace

private:
    int ReadMore(DataArea& area);

    std::size_t whole_ = 0;                 // bytes; of an object, more than an indicator tells
    std::shared_ptr<engine::Lob> object_;    // until it is read to its end
    std::uint64_t read_ = 0;
    std::uint64_t version_ = 0;             // of the object when it was begun
    std::string block_;
};
