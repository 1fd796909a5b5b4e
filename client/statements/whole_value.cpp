#include "statements/whole_value.h"

#include <algorithm>
#include <span>

#include "handles/errors.h"
#include "oci.h"
#include "platform/utf.h"
#include "statements/data_area.h"

namespace {

constexpr std::size_t kBlock = std::size_t{1} << 18;

bool IsText(const DataArea& area) { return area.Type()->family == values::Family::text; }

}  // namespace

// ---- Coming in

// The first piece stays as it is while it may be given again.
int PieceCollector::Append(const DataArea& area, WholeValue& whole, std::string_view piece, bool begins, bool last) {
    constexpr std::uint64_t kLongest = 0x7FFFFFFF;
    if (begins) {
        length_ = 0;
        closed_ = false;
        torn_.clear();
    }
    if (piece.size() > kLongest - length_) return errors::kPiecesTooLong;
    length_ += piece.size();
    const bool is_short = length_ <= engine::kHeldWhole || (begins && !last);
    if (!whole.object && (is_short || !store_)) {
        whole.bytes.append(piece);
        return 0;
    }
    if (!whole.object) {
        const auto kind = IsText(area) ? engine::LobKind::characters : engine::LobKind::bytes;
        std::shared_ptr<engine::Lob> object;
        if (Status status = store_->CreateTemporary(kind, object); status.Failed()) return status.Number();
        if (const int error = Write(area, *object, whole.bytes, false)) return error;
        std::string().swap(whole.bytes);
        whole.object = std::move(object);
    }
    return Write(area, *whole.object, piece, last);
}

// Text of a terminated type ends at the zero.
int PieceCollector::Write(const DataArea& area, engine::Lob& object, std::string_view piece, bool last) {
    const bool converts = IsText(area) && area.workspace.set;
    std::uint64_t at = 0;
    if (Status status = object.Length(at); status.Failed()) return status.Number();
    std::string utf8;
    for (bool more = true; more;) {
        std::string_view part = piece.substr(0, kBlock);
        piece.remove_prefix(part.size());
        more = !piece.empty();
        if (converts) {
            utf8.clear();
            if (!charset::PartToUtf8(*area.workspace.set, part, last && !more, torn_, utf8)) return errors::kBadCharacters;
            part = utf8;
        }
        if (area.Type()->code == SQLT_STR) {
            const std::size_t end = closed_ ? 0 : part.find('\0');
            closed_ = end != std::string_view::npos;
            part = part.substr(0, end);
        }
        if (Status status = object.Write(at, std::as_bytes(std::span(part))); status.Failed()) return status.Number();
        at += part.size();
    }
    return 0;
}

// ---- Going out

// Bytes out of characters are read as hexadecimal digits, all of them.
bool OutgoingValue::Streams(const DataArea& area, engine::LobKind kind) {
    return IsText(area) || kind == engine::LobKind::bytes;
}

void OutgoingValue::Start(std::shared_ptr<engine::Lob> object) {
    rest = {};
    whole_ = engine::kHeldWhole;
    object_ = std::move(object);
    version_ = object_->Version();
    read_ = 0;
}

int OutgoingValue::ReadMore(DataArea& area) {
    if (object_->Version() != version_) return errors::kSnapshotTooOld;    // old and new bytes are no value
    const bool has_characters = object_->Kind() == engine::LobKind::characters;
    std::uint64_t length = 0;
    std::size_t read = 0;
    block_.resize(kBlock);
    Status status = object_->Length(length);
    if (status.Ok()) status = object_->Read(read_, std::as_writable_bytes(std::span(block_)), read);
    if (status.Failed()) return status.Number();
    std::string_view text = std::string_view(block_).substr(0, read);
    const bool ends = read == 0 || read_ + read >= length;
    if (!ends && has_characters) text = text.substr(0, std::max<std::size_t>(utf::WholeUtf8(text, read - 1), 1));
    engine::Datum value;
    value.kind = has_characters ? engine::Kind::text : engine::Kind::bytes;
    value.data = text.data();
    value.length = static_cast<std::uint32_t>(text.size());
    std::string_view whole;
    int error = (*area.Type()->pieces)[static_cast<std::size_t>(value.kind)](value, area.workspace, whole);
    if (error == 0 && IsText(area)) error = values::ToApplication(whole, area.workspace, whole);
    if (error != 0) return error;
    read_ += text.size();
    rest = whole;
    if (ends) object_ = nullptr;
    return 0;
}

std::int16_t OutgoingValue::CutIndicator() const {
    constexpr std::size_t kLongest = 32767;
    return whole_ <= kLongest ? static_cast<std::int16_t>(whole_) : values::kLongIndicator;
}
