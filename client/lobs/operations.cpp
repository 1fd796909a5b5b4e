#include "lobs/operations.h"

#include <algorithm>

#include "handles/character_set.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "lobs/streams.h"
#include "oci.h"

namespace lobs {
namespace {

constexpr std::size_t kBufferRoom = std::size_t{512} << 10;

Status CheckAlike(const LargeObject& one, const LargeObject& other) {
    if (one.HasCharacters() != other.HasCharacters()) return Error(errors::kLobTypeMismatch);
    return one.Located().national == other.Located().national ? Status() : Error(errors::kLobFormMismatch);
}

// Units of `from` from a byte on, to `at` in the other.
Status CopyUnits(LargeObject& to, std::uint64_t at, LargeObject& from, std::uint64_t bytes, std::uint64_t units) {
    std::string block;
    for (std::uint64_t done = 0; done < units;) {
        std::uint64_t count = 0;
        if (Status status = from.Read(bytes, kBlock, units - done, block, count); status.Failed()) return status;
        if (block.empty()) break;
        if (Status status = to.Replace(at + done, block, count); status.Failed()) return status;
        bytes += block.size();
        done += count;
    }
    return {};
}

Status CopyPart(LargeObject& to, LargeObject& from, std::uint64_t amount, std::uint64_t to_offset, std::uint64_t from_offset) {
    std::uint64_t length = 0;
    std::uint64_t bytes = 0;
    std::uint64_t reached = 0;
    if (Status status = from.Length(length); status.Failed()) return status;
    if (from_offset > length) return Error(errors::kSourceOffset);
    if (Status status = from.Seek(from_offset - 1, bytes, reached); status.Failed()) return status;
    return CopyUnits(to, to_offset - 1, from, bytes, amount);
}

// What is read must not be what is written meanwhile.
Status CopyOf(engine::Lob& lob, engine::LobStore& store, std::shared_ptr<engine::Lob>& copy) {
    std::uint64_t length = 0;
    Status status = store.CreateTemporary(lob.Kind(), copy);
    if (status.Ok()) status = lob.Length(length);
    return status.Ok() ? engine::CopyBytes(lob, 0, *copy, 0, length) : status;
}

auto FindOpened(const LargeObject& object, values::LobSession& session) {
    return std::find_if(session.opened.begin(), session.opened.end(),
                        [&](const auto& opened) { return opened.lob->IsSame(object.Lob()); });
}

void NoteWaiting(const LargeObject& object, bool waits) {
    for (auto& entry : object.Located().session->buffered)
        if (entry.by.lock() == object.Located().kept) entry.waits = waits;
}

}  // namespace

Status Find(LobDescriptor& descriptor, Link& link, LargeObject& object) {
    values::Located located = descriptor.Get();
    if (!located.lob || !located.session) return Error(errors::kInvalidLocator);
    if (!located.IsOf(link.lobs.get())) return Error(errors::kForeignLocator);
    object = LargeObject(descriptor, std::move(located));
    return {};
}

Status FindUnbuffered(LobDescriptor& descriptor, Link& link, LargeObject& object) {
    if (StreamGoesOn(link)) return Error(errors::kStreamOfAnother);
    if (Status status = Find(descriptor, link, object); status.Failed()) return status;
    return object.State().buffer ? Error(errors::kBufferingOn) : Status();
}

// ---- Copying

Status Copy(LargeObject& to, LargeObject& from, Link& link, std::uint64_t amount, std::uint64_t to_offset,
            std::uint64_t from_offset) {
    if (to_offset == 0 || from_offset == 0 || amount == 0) return Error(errors::kBadLobParameter);
    if (Status status = CheckAlike(to, from); status.Failed()) return status;
    if (Status status = CheckOpenForWriting(to, link); status.Failed()) return status;
    if (to.IsSame(from)) {
        std::shared_ptr<engine::Lob> copy;
        if (Status status = CopyOf(from.Lob(), *link.lobs->store, copy); status.Failed()) return status;
        LargeObject other(std::move(copy));
        return CopyPart(to, other, amount, to_offset, from_offset);
    }
    return CopyPart(to, from, amount, to_offset, from_offset);
}

Status Append(LargeObject& to, LargeObject& from, Link& link) {
    std::uint64_t length = 0;
    std::uint64_t end = 0;
    if (Status status = CheckAlike(to, from); status.Failed()) return status;
    if (Status status = from.Length(length); status.Failed()) return status;
    if (Status status = to.Length(end); status.Failed()) return status;
    if (length == 0) return to.Lob().CheckWrite();
    return Copy(to, from, link, length, end + 1, 1);
}

// No file locator is ever filled: there are no files of a server's.
Status LoadFromFile() { return Error(errors::kInvalidLocator, "no files of a server"); }

// ---- Opening

Status Open(LargeObject& object, Link& link, std::uint8_t mode) {
    if (mode != OCI_LOB_READONLY && mode != OCI_LOB_READWRITE) return Error(errors::kBadLobParameter);
    if (IsOpen(object, link)) return Error(errors::kLobAlreadyOpen);
    const bool writes = mode == OCI_LOB_READWRITE;
    if (writes) {
        if (!object.Lob().IsTemporary() && !link.Engine().InTransaction()) return Error(errors::kNoTransactionToOpen);
        if (Status status = object.Lob().CheckWrite(); status.Failed()) return status;
    }
    link.lobs->opened.push_back({object.Located().lob, writes});
    return {};
}

Status Close(LargeObject& object, Link& link) {
    const auto found = FindOpened(object, *link.lobs);
    if (found == link.lobs->opened.end()) return Error(errors::kLobNotOpen);
    link.lobs->opened.erase(found);
    return {};
}

bool IsOpen(const LargeObject& object, const Link& link) {
    return FindOpened(object, *link.lobs) != link.lobs->opened.end();
}

Status CheckOpenForWriting(const LargeObject& object, const Link& link) {
    for (const auto& entry : link.lobs->buffered) {
        const auto by = entry.by.lock();    // null: what waited is gone with its locator
        if (by && entry.waits && entry.lob->IsSame(object.Lob()) && by != object.Located().kept)
            return Error(errors::kTwoLocatorsModify);
    }
    const auto found = FindOpened(object, *link.lobs);
    return found == link.lobs->opened.end() || found->writes ? Status() : Error(errors::kLobReadOnly);
}

// ---- Temporary ones, assigning

Status CreateTemporary(LobDescriptor& descriptor, Link& link, const TemporaryArguments& arguments) {
    if (StreamGoesOn(link)) return Error(errors::kStreamOfAnother);
    if (arguments.type < OCI_TEMP_BLOB || arguments.type > OCI_TEMP_NCLOB) return Error(errors::kBadLobParameter);
    if (arguments.form > SQLCS_NCHAR) return Error(errors::kBadLobForm);
    if (arguments.duration != OCI_DURATION_SESSION && arguments.duration != OCI_DURATION_CALL)
        return Error(errors::kBadLobParameter);
    const bool binary = arguments.type == OCI_TEMP_BLOB;
    if (!binary && arguments.character_set != 0 && !charset::Find(arguments.character_set)) return Error(errors::kBadCharacterSet);
    values::Located made{nullptr, link.lobs, !binary && (arguments.type == OCI_TEMP_NCLOB || arguments.form == SQLCS_NCHAR),
                         nullptr};
    Status status = link.lobs->store->CreateTemporary(binary ? engine::LobKind::bytes : engine::LobKind::characters,
                                                      made.lob);
    if (status.Ok()) descriptor.Set(std::move(made));
    return status;
}

Status FreeTemporary(LobDescriptor& descriptor, Link& link) {
    if (StreamGoesOn(link)) return Error(errors::kStreamOfAnother);
    LargeObject object;
    if (Status status = Find(descriptor, link, object); status.Failed()) return status;
    if (!object.Lob().IsTemporary()) return Error(errors::kInvalidLocator);
    if (IsOpen(object, link)) (void)Close(object, link);
    descriptor.Set({});
    return {};
}

Status Assign(LobDescriptor& to, const LobDescriptor& from) {
    values::Located located = from.Get();
    if (!located.lob) return Error(errors::kInvalidLocator);
    if (&to == &from) return {};
    if (located.session) {
        const SerialLock lock(located.session->serial);
        if (located.session->Waits(located.kept)) return Error(errors::kUpdatedLocator);
    }
    located.kept = nullptr;
    if (located.lob->IsTemporary()) {
        const SerialLock lock(located.session->serial);
        if (!located.session->store) return Error(errors::kForeignLocator);
        std::shared_ptr<engine::Lob> copy;
        if (Status status = CopyOf(*located.lob, *located.session->store, copy); status.Failed()) return status;
        located.lob = std::move(copy);
    }
    to.Set(std::move(located));
    return {};
}

// ---- Buffering: one stretch of units waits, so that writes that follow each other become one

Status EnableBuffering(LargeObject& object, Link& link) {
    auto& buffered = link.lobs->buffered;
    std::erase_if(buffered, [](const auto& entry) { return entry.by.expired(); });
    for (const auto& entry : buffered)
        if (entry.lob->IsSame(object.Lob())) return Error(errors::kTwoLocatorsModify);
    buffered.push_back({object.Located().lob, object.Located().kept, false});
    object.State().buffer.emplace();
    return {};
}

// What waits is not lost.
Status DisableBuffering(LargeObject& object, Link& link) {
    if (!object.State().buffer) return Error(errors::kNoBuffering);
    if (Status status = Flush(object); status.Failed()) return status;
    object.State().buffer.reset();
    std::erase_if(link.lobs->buffered, [&](const auto& entry) { return entry.by.lock() == object.Located().kept; });
    return {};
}

Status FlushBuffer(LargeObject& object, Link& link, std::uint32_t flag) {
    if (flag != OCI_LOB_BUFFER_FREE && flag != OCI_LOB_BUFFER_NOFREE) return Error(errors::kBadLobParameter);
    if (!object.State().buffer) return Error(errors::kNoBuffering);
    if (Status status = CheckOpenForWriting(object, link); status.Failed()) return status;
    if (Status status = Flush(object); status.Failed()) return status;
    if (flag == OCI_LOB_BUFFER_FREE) std::string().swap(object.State().buffer->data);
    return {};
}

Status Flush(LargeObject& object) {
    std::optional<WriteBuffer>& buffer = object.State().buffer;
    if (!buffer || buffer->units == 0) return {};
    Status status = object.Replace(buffer->first, buffer->data, buffer->units);
    if (status.Failed()) return status;
    buffer->units = 0;
    buffer->data.clear();
    NoteWaiting(object, false);
    return {};
}

Status WriteIntoBuffer(LargeObject& object, std::uint64_t at, std::string_view data, std::uint64_t units) {
    WriteBuffer& buffer = *object.State().buffer;
    const bool follows = buffer.units > 0 && at == buffer.first + buffer.units;
    if (!follows) {
        if (Status status = Flush(object); status.Failed()) return status;
        std::uint64_t length = 0;
        if (Status status = object.Length(length); status.Failed()) return status;
        if (at > length) return Error(errors::kBufferGap);
        buffer.first = at;
    }
    if (buffer.data.size() + data.size() > kBufferRoom) return Error(errors::kNoBufferLeft);
    buffer.data.append(data);
    buffer.units += units;
    NoteWaiting(object, true);
    return {};
}

}  // namespace lobs
