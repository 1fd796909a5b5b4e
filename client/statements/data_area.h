// What bind and define handles have in common. The data area says where the application keeps its data and in which
// form; handle and statement share it, so that neither has to find the other gone: an area whose handle is freed counts
// as not there, and lives on only as long as the call that works with it.
//
// Threads: calls on the handle and on the statement hold the statement's serial lock; HasHandle and Owner need no lock.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>

#include "handles/attributes.h"
#include "handles/object.h"
#include "handles/status.h"
#include "oci.h"
#include "statements/share.h"
#include "values/conversion.h"

// An array of lengths: of 16 bits, or of 32 as the wide forms of the calls take it.
struct LengthArray {
    LengthArray(ub2* array) : array(reinterpret_cast<char*>(array)), wide(false) {}    // NOLINT(google-explicit-constructor)
    LengthArray(ub4* array) : array(reinterpret_cast<char*>(array)), wide(true) {}     // NOLINT(google-explicit-constructor)
    char* array;
    bool wide;
};

// The arguments that the bind and define calls share.
struct AreaArguments {
    dvoid* value;
    sb8 size;
    ub2 type;
    dvoid* indicators;
    LengthArray lengths;
    ub2* codes;
};

// Where the next piece of a value goes or comes from.
struct PieceBuffer {
    void* buffer = nullptr;
    ub4* length = nullptr;
    void* indicator = nullptr;
    ub2* code = nullptr;
    ub1 piece = OCI_ONE_PIECE;
    bool is_set = false;
};

// What asks the application for the places of pieces; functions that it did not give are null.
struct Callbacks {
    OCICallbackInBind in = nullptr;
    void* in_context = nullptr;
    OCICallbackOutBind out = nullptr;
    OCICallbackDefine define = nullptr;
    void* out_context = nullptr;

    // Whether a bind's values are given or taken by callback, rather than by polling.
    [[nodiscard]] bool Any() const { return in || out; }
    [[nodiscard]] bool Serve(bool comes_out) const { return comes_out ? out || define : in != nullptr; }
};

class DataArea {
public:
    DataArea(Object& handle, TypeCode handle_type);

    // Takes over where the data are; the steps are those of plain arrays. Nothing changes when it is refused.
    Status Assign(const AreaArguments& arguments, bool in_pieces);
    // Steps of an array of structures, in bytes.
    void SetSteps(ub4 value, ub4 indicator, ub4 length, ub4 code);
    // 24305 for an area that takes no pieces.
    Status SetCallbacks(const Callbacks& callbacks);
    // Whether the application could still hand the handle in.
    [[nodiscard]] bool HasHandle() const noexcept { return live::KindOf(workspace.holder) != Kind::none; }
    [[nodiscard]] Object* Handle() const noexcept { return Live<Object>(workspace.holder); }
    // The handle as the application knows it, for who has found it living in this call.
    [[nodiscard]] dvoid* Pointer() const noexcept { return const_cast<dvoid*>(workspace.holder.load()); }
    [[nodiscard]] TypeCode HandleType() const { return handle_type_; }

    // The statement that the area belongs to, which may be gone; null: none.
    [[nodiscard]] std::shared_ptr<StatementShare> Owner() const;
    void SetOwner(std::shared_ptr<StatementShare> owner) noexcept;

    [[nodiscard]] const values::ExternalType* Type() const { return type_; }
    // Whether elements are descriptors of dates, times or intervals.
    [[nodiscard]] bool IsDatetime() const {
        if (!type_) return false;
        return (type_->family == values::Family::date && type_->is_pointer) || type_->family == values::Family::interval;
    }
    [[nodiscard]] bool InPieces() const { return in_pieces_; }
    [[nodiscard]] const Callbacks& AsksBy() const { return callbacks_; }
    // 0 is the environment's: the national one for the form SQLCS_NCHAR. Error 24329 for a set that is not known.
    Status UseCharacterSet(std::uint16_t id, std::uint8_t form);

    values::Elements elements;
    values::Workspace workspace;
    PieceBuffer piece;              // as OCIStmtSetPieceInfo said; used by the next execute or fetch, once
    std::uint32_t position = 0;     // from 1; of the placeholder or column

    // Attributes that are kept.
    std::uint16_t character_set = 0;    // 0: the environment's
    std::uint8_t character_form = SQLCS_IMPLICIT;
    std::int32_t most_bytes = 0;
    std::int32_t most_characters = 0;
    std::uint32_t character_count = 0;
    std::uint8_t fraction_digits = 9;
    std::uint8_t leading_digits = 9;

private:
    const TypeCode handle_type_;
    const values::ExternalType* type_ = nullptr;
    bool in_pieces_ = false;
    Callbacks callbacks_;
    mutable std::mutex owner_mutex_;
    std::shared_ptr<StatementShare> owner_;
};

// Takes an area out of its statement's hands; a handle that the statement made goes with it, one that the application
// allocated itself is only let loose.
void ReleaseArea(DataArea& area, const Object& statement) noexcept;

// A handle with its area.
template <class Area>
class AreaHandle : public Object {
public:
    explicit AreaHandle(const Origin& origin) : Object(origin), area(std::make_shared<Area>(*this, origin.type)) {}
    ~AreaHandle() override { area->workspace.holder = nullptr; }
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override {
        const std::shared_ptr<StatementShare> owner = area->Owner();
        return owner ? owner->Serial() : nullptr;
    }
    const std::shared_ptr<Area> area;
};
