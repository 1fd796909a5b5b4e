// OCI_ATTR_FNCODE: the numbers of the calls that error handles and environments have met. Calls without a published
// number are 0.
#pragma once

#include <cstdint>

#include "handles/attributes.h"

// Of a function by its name; null: none.
std::uint32_t FunctionCode(const char* name) noexcept;

// Of the last call on an object that keeps its name.
template <class T>
Status GetLastCall(T& object, AttributeValue& value) {
    value.integer = FunctionCode(object.last_call);
    return {};
}
