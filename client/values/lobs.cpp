#include "values/lobs.h"

#include <algorithm>
#include <cstring>

#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"
#include "values/in_rows.h"
#include "values/out_rows.h"

namespace values {
namespace {

using engine::Datum;
using engine::Kind;
using engine::LobKind;

constexpr std::uint64_t kLongestValue = 1 << 30;    // that is held in memory

int ReadFrom(engine::Lob& lob, std::uint64_t most, std::string& content, Datum& value, std::uint64_t& length) {
    if (Status status = lob.Length(length); !status.Ok()) return status.Number();
    const std::uint64_t wanted = std::min(length, most);
    if (wanted > kLongestValue) return errors::kOutOfMemory;
    content.resize(static_cast<std::size_t>(wanted));
    std::size_t read = 0;
    const auto room = std::as_writable_bytes(std::span(content));
    if (Status status = lob.Read(0, room, read); !status.Ok()) return status.Number();
    value.kind = lob.Kind() == LobKind::characters ? Kind::text : Kind::bytes;
    value.length = static_cast<std::uint32_t>(read);
    value.data = content.data();
    return 0;
}

LobDescriptor* DescriptorAt(const char* at) {
    void* pointer;
    std::memcpy(&pointer, at, sizeof pointer);
    return Live<LobDescriptor>(pointer);
}

// An object of its own with the value.
int MakeLob(const Datum& datum, LobKind kind, Workspace& workspace, std::shared_ptr<engine::Lob>& lob) {
    Status status = workspace.lobs->store->CreateTemporary(kind, lob);
    if (status.Ok()) status = lob->Write(0, std::as_bytes(std::span(datum.Text())));
    return status.Number();
}

int TakeLob(const Datum& datum, LobKind kind, Workspace& workspace, std::shared_ptr<engine::Lob>& lob) {
    const Kind plain = kind == LobKind::characters ? Kind::text : Kind::bytes;
    if (datum.kind == plain) return MakeLob(datum, kind, workspace, lob);
    if (datum.kind != Kind::lob) return errors::kInconsistentTypes;
    if (Status status = workspace.lobs->store->Take(datum, false, lob); !status.Ok()) return status.Number();
    return lob->Kind() == kind ? 0 : errors::kInconsistentTypes;
}

template <LobKind kind, bool national>
int PutLocator(const Datum& datum, Workspace& workspace, Target& target) {
    LobDescriptor* const descriptor = DescriptorAt(target.at);
    if (!descriptor) return errors::kInvalidLocator;
    if (!workspace.lobs->store) return errors::kInconsistentTypes;
    descriptor->Set({});    // what it held may be a copy, whose room the next one takes
    std::shared_ptr<engine::Lob> lob;
    if (const int error = TakeLob(datum, kind, workspace, lob)) return error;
    descriptor->Set({std::move(lob), workspace.lobs, national, nullptr, workspace.lobs->store});
    target.stored = sizeof(void*);
    return 0;
}

template <auto put>
constexpr ByOrigin<OutConverter> kLocatorRow = {
    NoConversion, NoConversion, NoConversion, NoConversion, put, put, NoConversion, put, NoConversion,
    NoConversion, NoConversion, NoConversion, NoConversion, NoConversion};

}  // namespace

const ByOrigin<OutConverter> kToClob = kLocatorRow<PutLocator<LobKind::characters, false>>;
const ByOrigin<OutConverter> kToDbclob = kLocatorRow<PutLocator<LobKind::characters, true>>;
const ByOrigin<OutConverter> kToBlob = kLocatorRow<PutLocator<LobKind::bytes, false>>;

int ReadLob(const Datum& datum, LobSession* session, std::uint64_t most, std::string& content, Datum& value,
            std::uint64_t& length) {
    if (!session->store) return errors::kInconsistentTypes;
    std::shared_ptr<engine::Lob> lob;
    if (Status status = session->store->Take(datum, true, lob); !status.Ok()) return status.Number();
    return ReadFrom(*lob, most, content, value, length);
}

int TakeLong(const Datum& datum, LobSession* session, std::shared_ptr<engine::Lob>& lob) {
    if (!session->store) return errors::kInconsistentTypes;
    std::uint64_t length = 0;
    Status status = session->store->Take(datum, true, lob);
    if (status.Ok()) status = lob->Length(length);
    if (status.Ok() && length > engine::kHeldWhole) status = session->store->Take(datum, false, lob);
    if (status.Failed() || length <= engine::kHeldWhole) lob = nullptr;
    return status.Number();
}

namespace {

// 22275 for an empty one, 22927 for one of another session. A long one goes as the object that it is, where the engine
// takes such.
int ReadLocator(const Located& located, Workspace& workspace, Datum& value) {
    const LobSession* const session = workspace.lobs.get();
    if (!located.lob) return errors::kInvalidLocator;
    if (located.session && !located.IsOf(session)) return errors::kForeignLocator;
    if (session->Waits(located.kept)) return errors::kUpdatedLocator;
    std::uint64_t length = 0;
    if (session->store && session->store->TakesObjects()) {
        if (Status status = located.lob->Length(length); !status.Ok()) return status.Number();
    }
    if (length <= engine::kHeldWhole) return ReadFrom(*located.lob, kWholeLob, workspace.content, value, length);
    workspace.object = located.lob;
    value.kind = Kind::lob;
    value.length = 0;
    value.data = workspace.object.get();
    return 0;
}

int FromLocator(LobKind kind, const Source& source, Workspace& workspace, Datum& datum) {
    const LobDescriptor* const descriptor = DescriptorAt(source.at);
    if (!descriptor) return errors::kInvalidLocator;
    const Located located = descriptor->Get();
    if (located.session && located.lob->Kind() != kind) return errors::kInconsistentTypes;
    return ReadLocator(located, workspace, datum);
}

}  // namespace

int FromClob(const Source& source, Workspace& workspace, Datum& datum) {
    return FromLocator(LobKind::characters, source, workspace, datum);
}
int FromBlob(const Source& source, Workspace& workspace, Datum& datum) {
    const int error = FromLocator(LobKind::bytes, source, workspace, datum);
    if (error == 0 && datum.kind == Kind::text) datum.kind = Kind::bytes;    // of an empty one
    return error;
}

}  // namespace values

namespace {

// An empty object of characters, which is what an insert then stores: OCI_ATTR_LOBEMPTY takes 0 alone.
class EmptyLob final : public engine::Lob {
public:
    [[nodiscard]] engine::LobKind Kind() const override { return engine::LobKind::characters; }
    [[nodiscard]] bool IsTemporary() const override { return false; }
    [[nodiscard]] bool IsSame(const Lob& other) const override { return this == &other; }
    [[nodiscard]] std::uint64_t Version() const override { return 0; }
    Status Length(std::uint64_t& bytes) override { return bytes = 0, Status(); }
    Status Read(std::uint64_t, std::span<std::byte>, std::size_t& read) override { return read = 0, Status(); }
    Status CheckWrite() override { return Error(errors::kInvalidLocator); }
    Status Write(std::uint64_t, std::span<const std::byte>) override { return CheckWrite(); }
    Status Trim(std::uint64_t) override { return CheckWrite(); }
};

Status SetEmpty(Object& object, const AttributeValue& value) {
    if (value.integer != 0) return Error(errors::kBadValue);
    static_cast<LobDescriptor&>(object).Set({std::make_shared<EmptyLob>(), nullptr, false, nullptr});
    return {};
}

constexpr AttributeRow kLobRows[] = {{OCI_ATTR_LOBEMPTY, Shape::ub4, nullptr, SetEmpty}};

}  // namespace

std::span<const AttributeRow> LobDescriptor::Attributes() const { return kLobRows; }
