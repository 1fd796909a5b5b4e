// OCIAttrGet and OCIAttrSet over the rows that the classes supply.
#include "handles/attributes.h"

#include <cstring>

#include "handles/environment.h"
#include "handles/errors.h"
#include "handles/gate.h"

namespace {

Status EnvironmentOf(Object& object, AttributeValue& value) {
    value.pointer = &object.Env();
    return {};
}

Status UserMemoryOf(Object& object, AttributeValue& value) {
    value.pointer = object.UserMemory();
    return {};
}

// What every object has.
constexpr AttributeRow kCommonRows[] = {
    {OCI_ATTR_ENV, Shape::handle, EnvironmentOf, nullptr},
    {OCI_ATTR_USER_MEMORY, Shape::handle, UserMemoryOf, nullptr},
};

const AttributeRow* Find(const Object& object, std::uint32_t attribute) {
    for (const AttributeRow& row : object.Attributes()) {
        if (row.attribute == attribute) return &row;
    }
    for (const AttributeRow& row : kCommonRows) {
        if (row.attribute == attribute) return &row;
    }
    return nullptr;
}

std::size_t Width(Shape shape) {
    switch (shape) {
        case Shape::ub1: return 1;
        case Shape::ub2: return 2;
        case Shape::ub4: return 4;
        case Shape::ub8: return 8;
        case Shape::text:
        case Shape::handle:
        case Shape::bytes:
        case Shape::descriptor: break;
    }
    return 0;
}

// The low bytes of the integer, in native (little-endian) order.
void StoreInteger(std::uint64_t integer, std::size_t width, void* target) { std::memcpy(target, &integer, width); }

std::uint64_t LoadInteger(const void* source, std::size_t width) {
    std::uint64_t integer = 0;
    std::memcpy(&integer, source, width);
    return integer;
}

// The application gets a pointer into the object: the member itself, or in UTF-16 its converted copy.
void StoreText(Object& object, std::uint32_t attribute, const AttributeValue& value, void* target,
               std::uint32_t* size) {
    const std::string_view text = value.text;
    std::string_view out = text;
    if (object.Env().Converts() && !value.converted) out = TextOut(object.Env(), text, object.KeptText(attribute));
    const char* pointer = out.empty() ? nullptr : out.data();
    std::memcpy(target, &pointer, sizeof pointer);
    if (size) *size = static_cast<std::uint32_t>(out.size());
}

void StoreValue(Object& object, const AttributeRow& row, const AttributeValue& value, void* target,
                std::uint32_t* size) {
    const std::size_t width = Width(row.shape);
    switch (row.shape) {
        case Shape::text: return StoreText(object, row.attribute, value, target, size);
        case Shape::descriptor: return;
        case Shape::handle:
            std::memcpy(target, &value.pointer, sizeof value.pointer);
            if (size) *size = sizeof value.pointer;
            return;
        case Shape::bytes:
            std::memcpy(target, value.text.data(), value.text.size());
            if (size) *size = static_cast<std::uint32_t>(value.text.size());
            return;
        case Shape::ub1:
        case Shape::ub2:
        case Shape::ub4:
        case Shape::ub8:
            StoreInteger(value.integer, width, target);
            if (size) *size = static_cast<std::uint32_t>(width);
            return;
    }
}

}  // namespace

Status GetAttribute(Object& object, void* target, std::uint32_t* size, std::uint32_t attribute) {
    const AttributeRow* row = Find(object, attribute);
    if (!row || !row->get) return Error(errors::kUnknownAttribute);
    if (!target) return Error(errors::kNullArgument);
    AttributeValue value;
    if (row->shape == Shape::descriptor) value.pointer = target;
    Status status = row->get(object, value);
    if (status.Ok()) StoreValue(object, *row, value, target, size);
    return status;
}

Status SetAttribute(Object& object, const void* source, std::uint32_t size, std::uint32_t attribute) {
    const AttributeRow* row = Find(object, attribute);
    if (!row || !row->set) return Error(errors::kUnknownAttribute);
    if (row->size != 0 && size != row->size) return Error(errors::kBadAttributeSize);
    AttributeValue value;
    if (!row->looks_at_value) return row->set(object, value);
    if (row->shape == Shape::handle) {
        value.pointer = const_cast<void*>(source);
        return row->set(object, value);
    }
    if (row->shape == Shape::text) {
        if (!source && size > 0) return Error(errors::kBadValue);
        const TextIn text(object.Env(), source, size);
        if (!text.Valid()) return Error(errors::kBadText);
        value.text = text.View();
        return row->set(object, value);
    }
    if (!source) return Error(errors::kBadValue);
    if (row->shape == Shape::bytes) value.text = {static_cast<const char*>(source), size};
    else value.integer = LoadInteger(source, Width(row->shape));
    return row->set(object, value);
}
