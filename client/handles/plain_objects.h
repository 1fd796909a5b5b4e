// Handles and descriptors that the library makes and frees but does nothing with: whoever allocates one gets an object
// with user memory and the attributes that only keep what they are given.
#pragma once

#include <cstdint>
#include <string>

#include "handles/object.h"

class PlainHandle : public Object {
public:
    static constexpr Kind kKind = Kind::plain_handle;
    explicit PlainHandle(const Origin& origin) : Object(origin) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    // Of subscription handles.
    std::string name;
    void* callback = nullptr;
    void* context = nullptr;
    std::uint32_t name_space = 0;
};

class PlainDescriptor : public Object {
public:
    static constexpr Kind kKind = Kind::plain_descriptor;
    explicit PlainDescriptor(const Origin& origin) : Object(origin) {}
};

// A point in time of a database, as two numbers.
class Snapshot : public Object {
public:
    static constexpr Kind kKind = Kind::snapshot;
    explicit Snapshot(const Origin& origin) : Object(origin) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    std::uint32_t base = 0;
    std::uint32_t wrap = 0;
};

// What OCIArrayDescriptorAlloc made in one call: the parent of its descriptors, never handed out itself.
class DescriptorArray : public Object {
public:
    static constexpr Kind kKind = Kind::descriptor_array;
    explicit DescriptorArray(const Origin& origin) : Object(origin) {}

    const Object* first = nullptr;    // the descriptor that an application's array of them begins with; only compared
};
