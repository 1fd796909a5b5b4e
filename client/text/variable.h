// Strings and raws: values of any length that the library keeps for the application. They belong to their environment
// and their memory comes from it. A string holds its text in the application's form: UTF-16 where the environment has
// that. Nothing locks: threads do not change a value at a time. The memory functions, which are called in the middle of
// a change, may change or free any value, this one too.
#pragma once

#include <cstdint>
#include <string_view>

#include "handles/object.h"
#include "handles/status.h"

class Variable : public Object {
public:
    explicit Variable(const Origin& origin) : Object(origin) {}
    // With what a first change(variable) makes of it, before any thread can find it, behind an old pointer either.
    template <class Change>
    Variable(const Origin& origin, const Change& change, Status& outcome) : Object(origin) { outcome = change(*this); }
    ~Variable() override;

    // Two zeros follow the content, for those who read texts to their end. Valid until the next change.
    [[nodiscard]] char* Data() const { return data_; }
    [[nodiscard]] std::uint32_t Size() const { return size_; }
    [[nodiscard]] std::uint32_t Room() const { return room_; }    // never below the size
    [[nodiscard]] std::string_view View() const { return {data_, size_}; }

    // Copies what the application holds. Error 22140 for what is too long; throws std::bad_alloc.
    Status Assign(std::string_view content);
    // Copies another value, or this one.
    Status Assign(const Variable& other);
    // Makes the room `size` bytes; of the content stays what fits.
    Status Resize(std::uint32_t size);

private:
    // Changes to a new block of `room` bytes with what content() says then, cut to that room.
    template <class Content>
    void Replace(std::uint32_t room, Content content);

    char* data_ = nullptr;    // null until something is assigned
    std::uint32_t size_ = 0;
    std::uint32_t room_ = 0;
};

class String : public Variable {
public:
    static constexpr Kind kKind = Kind::string;
    using Variable::Variable;
};

class Raw : public Variable {
public:
    static constexpr Kind kKind = Kind::raw;
    using Variable::Variable;
};
