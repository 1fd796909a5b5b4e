// What calls do with large objects besides reading and writing: copying, opening, assigning, making temporary ones,
// buffering. Offsets of calls count from 1.
//
// Threads: under the serial lock of the session, but where it says that there is none.
#pragma once

#include <cstdint>

#include "lobs/object.h"
#include "sessions/link.h"

namespace lobs {

// The object of a locator in a session: 22275 for an empty locator, 22927 for one of another session.
Status Find(LobDescriptor& descriptor, Link& link, LargeObject& object);
// For calls that no stream (24820) and no buffering (22279) may be in the way of.
Status FindUnbuffered(LobDescriptor& descriptor, Link& link, LargeObject& object);

Status Copy(LargeObject& to, LargeObject& from, Link& link, std::uint64_t amount, std::uint64_t to_offset, std::uint64_t from_offset);
Status Append(LargeObject& to, LargeObject& from, Link& link);
Status LoadFromFile();

Status Open(LargeObject& object, Link& link, std::uint8_t mode);
Status Close(LargeObject& object, Link& link);
bool IsOpen(const LargeObject& object, const Link& link);
// 22294, and 22277 where what was written through another locator's buffer waits.
Status CheckOpenForWriting(const LargeObject& object, const Link& link);

struct TemporaryArguments {
    std::uint16_t character_set;
    std::uint8_t form;
    std::uint8_t type;
    std::uint16_t duration;
};
Status CreateTemporary(LobDescriptor& descriptor, Link& link, const TemporaryArguments& arguments);
Status FreeTemporary(LobDescriptor& descriptor, Link& link);
// Makes `to` a locator of the same object, or of a copy of a temporary one. Takes the session's lock itself.
Status Assign(LobDescriptor& to, const LobDescriptor& from);

Status EnableBuffering(LargeObject& object, Link& link);    // 22277 when another locator of the object has it on
Status DisableBuffering(LargeObject& object, Link& link);
Status FlushBuffer(LargeObject& object, Link& link, std::uint32_t flag);
Status Flush(LargeObject& object);    // what waits, if anything does
// A write that waits: 22280 where the buffer is full, 22282 for one behind the end.
Status WriteIntoBuffer(LargeObject& object, std::uint64_t at, std::string_view data, std::uint64_t units);

}  // namespace lobs
