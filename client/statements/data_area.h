// What bind and define handles have in common: where the application keeps the data and in which form, and the buffer
// that it gave for the next piece of a value.
#pragma once

#include <cstdint>
#include <string>

#include "handles/object.h"
#include "handles/status.h"
#include "oci.h"
#include "values/conversion.h"

class Statement;

// The arguments that the bind and define calls share.
struct AreaArguments {
    dvoid* value;
    sb4 size;
    ub2 type;
    dvoid* indicators;
    ub2* lengths;
    ub2* codes;
};

// Where the next piece goes or comes from, as OCIStmtSetPieceInfo said. Used by the next execute or fetch, once.
struct PieceBuffer {
    void* buffer = nullptr;
    ub4* length = nullptr;
    void* indicator = nullptr;
    ub2* code = nullptr;
    ub1 piece = OCI_ONE_PIECE;
    bool is_set = false;
};

class DataArea : public Object {
public:
    // Takes over where the data are; the steps are those of plain arrays. Nothing changes when it is refused.
    Status Assign(const AreaArguments& arguments, bool in_pieces);
    // Steps of an array of structures, in bytes.
    void SetSteps(ub4 value, ub4 indicator, ub4 length, ub4 code);

    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;
    [[nodiscard]] const values::ExternalType* Type() const { return type_; }
    [[nodiscard]] bool InPieces() const { return in_pieces_; }

    values::Elements elements;
    values::Workspace workspace;
    PieceBuffer piece;
    std::uint32_t position = 0;     // from 1; of the placeholder or column
    Statement* statement = nullptr;

    // Attributes that are kept.
    std::uint16_t character_set = 0;    // 0: the environment's
    std::uint8_t character_form = SQLCS_IMPLICIT;
    std::int32_t most_bytes = 0;
    std::int32_t most_characters = 0;
    std::uint32_t character_count = 0;
    void UseCharacterSet(std::uint16_t id);

protected:
    explicit DataArea(const Origin& origin);

private:
    const values::ExternalType* type_ = nullptr;
    bool in_pieces_ = false;
};
