// Numbers to and from text by a format model (9 0 . , D G $ L C U B S MI PR EEEE V TM X RN FM) and the NLS text that
// goes with it. An empty model is the plain form. Models are ASCII; currency texts may be any UTF-8.
#pragma once

#include <cstddef>
#include <string_view>

#include "handles/errors.h"
#include "number/number.h"

namespace number {

// What a model's D, G, L, C and U stand for. The views are borrowed.
struct Nls {
    char decimal = '.';
    char group = ',';
    std::string_view currency = "$";
    std::string_view iso_currency = "USD";
    std::string_view dual_currency = "$";
};

// Reads settings like NLS_NUMERIC_CHARACTERS='',.'' NLS_CURRENCY=''EUR'' into those of *nls that are named; their views
// point into `text` or at constants. kBadNls leaves *nls in no particular state.
Errno ParseNls(std::string_view text, Nls* nls) noexcept;

// Writes the text of a number. *length is set on success, and on kBufferTooSmall to the size that is needed; the area
// holds the beginning of the text then.
Errno ToText(const OCINumber& value, std::string_view model, const Nls& nls, char* text, std::size_t capacity,
             std::size_t* length) noexcept;

// Reads a text that fits the model. A model of 9s alone, as long as the text, takes any plain number.
Errno FromText(std::string_view text, std::string_view model, const Nls& nls, OCINumber* result) noexcept;

}  // namespace number
