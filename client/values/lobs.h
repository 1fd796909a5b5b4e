// Large objects as values: read into text and bytes, put into locators, and taken from them.
#pragma once

#include <memory>
#include <string>

#include "values/conversion.h"
#include "values/lob_descriptor.h"

namespace values {

// The first `most` bytes of a Datum of Kind::lob as one of text or bytes, which views `content`; `length` is that of all.
int ReadLob(const engine::Datum& datum, LobSession* session, std::uint64_t most, std::string& content,
            engine::Datum& value, std::uint64_t& length);
// Of a locator, all of it: 22275 for an empty one, 22927 for one of another session.
int ReadLocator(const Located& located, const LobSession* session, std::string& content, engine::Datum& value);

constexpr std::uint64_t kWholeLob = ~std::uint64_t{0};

}  // namespace values
