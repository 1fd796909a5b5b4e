// Attributes of statements, and the parameters of their select lists.
#include "handles/attributes.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "statements/statement.h"
#include "values/rowid_descriptor.h"

// Reads what the class keeps to itself.
struct StatementAttributes {
    static Status Text(Statement& statement, AttributeValue& value) {
        value.text = statement.Text();
        return {};
    }
    static Status Type(Statement& statement, AttributeValue& value) {
        const bool is_result = !statement.text_.IsSet() && statement.HasResult();
        value.integer = is_result ? OCI_STMT_SELECT : static_cast<std::uint16_t>(statement.Scanned().type);
        return {};
    }
    static Status FunctionCode(Statement& statement, AttributeValue& value) {
        value.integer = statement.Scanned().function_code;
        return {};
    }
    static Status RowCount(Statement& statement, AttributeValue& value) {
        value.integer = statement.run_.row_count;
        return {};
    }
    static Status RowsFetched(Statement& statement, AttributeValue& value) {
        value.integer = statement.run_.rows_fetched;
        return {};
    }
    static Status FailedRows(Statement& statement, AttributeValue& value) {
        value.integer = statement.run_.failed_rows;
        return {};
    }
    static Status ColumnCount(Statement& statement, AttributeValue& value) {
        const auto* columns = statement.Columns();
        value.integer = columns ? columns->size() : 0;
        return {};
    }
    static Status BindCount(Statement& statement, AttributeValue& value) {
        value.integer = statement.Scanned().positions.size();
        return {};
    }
    static Status State(Statement& statement, AttributeValue& value) {
        value.integer = static_cast<std::uint8_t>(statement.run_.state);
        return {};
    }
    static Status Position(Statement& statement, AttributeValue& value) {
        value.integer = statement.run_.cursor.Position();
        return {};
    }
    static Status IsReturning(Statement& statement, AttributeValue& value) {
        value.integer = statement.Scanned().Returning();
        return {};
    }
    // Bytes of the application's text before the error.
    static Status ErrorOffset(Statement& statement, AttributeValue& value) {
        value.integer = statement.parse_error_offset_;
        if (!statement.Env().Converts()) return {};
        std::string units;
        const auto before = std::string_view(statement.Text()).substr(0, statement.parse_error_offset_);
        value.integer = TextOut(statement.Env(), before, units).size();
        return {};
    }
    static Status RowId(Statement& statement, AttributeValue& value) {
        auto* descriptor = Live<RowIdDescriptor>(value.pointer);
        if (!descriptor) return InvalidHandle();
        if (!statement.run_.last_row) return Error(errors::kInvalidRowId);
        descriptor->value = rowid::FromBytes(statement.run_.last_row->bytes.data());
        return {};
    }
};

namespace {

using S = StatementAttributes;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_STATEMENT, Shape::text, Get<Statement, S::Text>, nullptr},
    {OCI_ATTR_STMT_TYPE, Shape::ub2, Get<Statement, S::Type>, nullptr},
    {OCI_ATTR_SQLFNCODE, Shape::ub2, Get<Statement, S::FunctionCode>, nullptr},
    {OCI_ATTR_ROW_COUNT, Shape::ub4, Get<Statement, S::RowCount>, nullptr},
    {OCI_ATTR_UB8_ROW_COUNT, Shape::ub8, Get<Statement, S::RowCount>, nullptr},
    {OCI_ATTR_ROWS_FETCHED, Shape::ub4, Get<Statement, S::RowsFetched>, nullptr},
    {OCI_ATTR_NUM_DML_ERRORS, Shape::ub4, Get<Statement, S::FailedRows>, nullptr},
    {OCI_ATTR_PARAM_COUNT, Shape::ub4, Get<Statement, S::ColumnCount>, nullptr},
    {OCI_ATTR_BIND_COUNT, Shape::ub4, Get<Statement, S::BindCount>, nullptr},
    {OCI_ATTR_STMT_STATE, Shape::ub4, Get<Statement, S::State>, nullptr},
    {OCI_ATTR_CURRENT_POSITION, Shape::ub4, Get<Statement, S::Position>, nullptr},
    {OCI_ATTR_STMT_IS_RETURNING, Shape::ub1, Get<Statement, S::IsReturning>, nullptr},
    {OCI_ATTR_PARSE_ERROR_OFFSET, Shape::ub2, Get<Statement, S::ErrorOffset>, nullptr},
    {OCI_ATTR_ROWID, Shape::descriptor, Get<Statement, S::RowId>, nullptr},
    {OCI_ATTR_PREFETCH_ROWS, Shape::ub4, GetField<&Statement::prefetch_rows>, SetField<&Statement::prefetch_rows>},
    {OCI_ATTR_PREFETCH_MEMORY, Shape::ub4, GetField<&Statement::prefetch_memory>,
     SetField<&Statement::prefetch_memory>},
    {OCI_ATTR_NESTED_PREFETCH_ROWS, Shape::ub4, GetField<&Statement::nested_prefetch_rows>,
     SetField<&Statement::nested_prefetch_rows>},
    {OCI_ATTR_NESTED_PREFETCH_MEMORY, Shape::ub4, GetField<&Statement::nested_prefetch_memory>,
     SetField<&Statement::nested_prefetch_memory>},
};

}  // namespace

std::span<const AttributeRow> Statement::Attributes() const { return kRows; }

Status Statement::GetParameter(ub4 position, dvoid** out) {
    const std::vector<engine::Column>* columns = Columns();
    if (!columns || position == 0 || position > columns->size()) return Error(errors::kNoParameter);
    if (!out) return Error(errors::kNullArgument);
    const auto column = describe::SelectedColumn((*columns)[position - 1], position);
    dvoid* const parameter = &parameters_.At(position - 1, *this, Share(), column);
    columns = Columns();    // a memory function may have prepared anew
    if (!columns || position > columns->size()) return Error(errors::kNoParameter);
    *out = parameter;
    return {};
}
