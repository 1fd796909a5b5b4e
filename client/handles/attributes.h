// Attributes: what OCIAttrGet and OCIAttrSet know. Each class supplies rows (Object::Attributes); a row says how the
// value lies in the application's memory and which functions read and write it. The checks, the copying in and out,
// text conversion and the numbers 24315 (unknown or not readable), 24328 (bad value) and 21560 (null) are here, once.
//
//   constexpr AttributeRow kRows[] = {
//       {OCI_ATTR_PREFETCH_ROWS, Shape::ub4, GetField<&Statement::prefetch_rows>, SetField<&Statement::prefetch_rows>},
//       {OCI_ATTR_STATEMENT, Shape::text, Get<Statement, GetText>, nullptr}};
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

#include "handles/object.h"
#include "handles/status.h"

enum class Shape : std::uint8_t {
    ub1, ub2, ub4, ub8,    // integers of either sign, by address, in `integer`
    text,                  // characters and a length in bytes; UTF-8 in `text`. Get: it must live on in the object
    handle,                // a pointer to an object or anything else, in `pointer`; null: none. Set: as given
    bytes,                 // raw bytes in `text`; get copies them into the application's memory, set reads `size` bytes
    descriptor             // get: the application's own descriptor in `pointer`, to be filled
};

struct AttributeValue {
    std::uint64_t integer = 0;
    std::string_view text;
    bool converted = false;    // get: the text is in the application's form already
    void* pointer = nullptr;
};

struct AttributeRow {
    std::uint32_t attribute;
    Shape shape;
    Status (*get)(Object& object, AttributeValue& value);          // null: not readable
    Status (*set)(Object& object, const AttributeValue& value);    // null: not settable
    std::uint32_t size = 0;                                        // bytes: how many a set must have; 0: any
    bool looks_at_value = true;                                    // false: a set is a signal, whatever it gives
};

// Adapters from members and free functions to rows.
template <auto member>
struct MemberOf;
template <class T, class V, V T::*member>
struct MemberOf<member> { using Class = T; using Value = V; };

// A data member that is an integer, read or written as it is.
template <auto member>
Status GetField(Object& object, AttributeValue& value) {
    value.integer = static_cast<std::uint64_t>(static_cast<typename MemberOf<member>::Class&>(object).*member);
    return {};
}
template <auto member>
Status SetField(Object& object, const AttributeValue& value) {
    using M = MemberOf<member>;
    static_cast<typename M::Class&>(object).*member = static_cast<typename M::Value>(value.integer);
    return {};
}

// A data member that is a std::string.
template <auto member>
Status GetText(Object& object, AttributeValue& value) {
    value.text = static_cast<typename MemberOf<member>::Class&>(object).*member;
    return {};
}
template <auto member>
Status SetText(Object& object, const AttributeValue& value) {
    static_cast<typename MemberOf<member>::Class&>(object).*member = value.text;
    return {};
}

// Free functions over the class: Status F(T&, AttributeValue&) and Status F(T&, const AttributeValue&).
template <class T, Status (*function)(T&, AttributeValue&)>
Status Get(Object& object, AttributeValue& value) { return function(static_cast<T&>(object), value); }
template <class T, Status (*function)(T&, const AttributeValue&)>
Status Set(Object& object, const AttributeValue& value) { return function(static_cast<T&>(object), value); }

// The two calls, behind the gate.
Status GetAttribute(Object& object, void* value, std::uint32_t* size, std::uint32_t attribute);
Status SetAttribute(Object& object, const void* value, std::uint32_t size, std::uint32_t attribute);
