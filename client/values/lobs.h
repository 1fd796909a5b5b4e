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
// An object of its own for one of more than kHeldWhole bytes; none for a shorter one, which is read as above.
int TakeLong(const engine::Datum& datum, LobSession* session, std::shared_ptr<engine::Lob>& lob);

constexpr std::uint64_t kWholeLob = ~std::uint64_t{0};

}  // namespace values
