// FetchAllOCI: a whole result set as a table. Every column is defined for a fetch in pieces, and every value is handed
// the same buffer, piece by piece. The calls inside leave no trace lines. A row is one message; nothing is allocated
// for it. Command thread only.
#include <algorithm>
#include <cstring>
#include <string>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/memory.h"
#include "objects/text_conversion.h"
#include "platform/client_library.h"
#include "platform/utf.h"
#include "report/return_code.h"

namespace {

constexpr ub4 kPieceSize = 1000;

bool Failed(sword rc) {
    return rc != OCI_SUCCESS && rc != OCI_SUCCESS_WITH_INFO;
}

class ResultTable {
public:
    explicit ResultTable(OCIStmt* statement) : statement_(statement), error_(DefaultErrorHandle) {}
    ~ResultTable();
    ResultTable(const ResultTable&) = delete;
    ResultTable& operator=(const ResultTable&) = delete;

    // These three answer false when the command ends there, which has been said.
    bool Describe();
    bool PrintHeader();
    bool PrintRows(long most_rows);
    void PrintFooter();

private:
    bool Check(sword rc, bool failed);
    bool DefineColumn(ub4 position);
    bool AddColumnName(ub4 position);
    void PrintUnderline();
    sword Fetch();
    sword AskForPiece();
    bool ReceivePiece();
    bool ReceiveValue(ub4 column);
    void TakePiece();
    void EndValue(ub4 column);
    bool PrintRow();

    OCIStmt* statement_;
    OCIError* error_;
    const bool utf16_ = Utf16Mode;
    ub4 columns_ = 0;
    ub4 defined_ = 0;  // of the columns
    Memory<OCIDefine*> defines_;
    Memory<char> buffer_;
    size_t width_ = 0;  // of the header
    long rows_ = 0;
    Line line_;  // the row so far

    // The value under way, and the piece that the library is to deliver next.
    std::string value_;  // in UTF-16; any other goes into the line as it comes
    sword fetched_ = OCI_SUCCESS;  // what the last fetch answered
    void* define_ = nullptr;
    ub4 define_type_ = 0;
    ub1 piece_ = 0;
    ub4 length_ = 0;
    sb2 indicator_ = 0;
    ub2 return_code_ = 0;
};

ResultTable::~ResultTable() {
    for (ub4 column = 0; column < defined_; ++column)
        Call(&ClientLibrary::OCIHandleFree, defines_.get()[column], ub4{OCI_HTYPE_DEFINE});
}

// Ends the line where it is and reports the call, if it has failed.
bool ResultTable::Check(sword rc, bool failed) {
    if (!failed) return true;
    line_.Print();
    ReturnCodeReport(error_, rc);
    return false;
}

// --- Header ----------------------------------------------------------------------------------------------------------

bool ResultTable::Describe() {
    const sword rc = Call(&ClientLibrary::OCIAttrGet, statement_, ub4{OCI_HTYPE_STMT}, &columns_, nullptr,
                          ub4{OCI_ATTR_PARAM_COUNT}, error_);
    if (!Check(rc, Failed(rc))) return false;
    if (columns_ == 0) {
        Message(kOutput, "No result set to fetch\n");
        return false;
    }
    defines_.reset(static_cast<OCIDefine**>(GetMem(columns_ * sizeof(OCIDefine*))));
    if (defines_ == nullptr) return false;
    buffer_.reset(static_cast<char*>(GetMem(kPieceSize)));
    return buffer_ != nullptr;
}

// The size of 1 is no limit: with pieces, the buffer of each tells its own.
bool ResultTable::DefineColumn(ub4 position) {
    const sword rc = Call(&ClientLibrary::OCIDefineByPos, statement_, &defines_.get()[position - 1], error_, position,
                          buffer_.get(), sb4{1}, ub2{SQLT_STR}, nullptr, nullptr, nullptr, ub4{OCI_DYNAMIC_FETCH});
    if (!Check(rc, Failed(rc))) return false;
    defined_ = position;
    return true;
}

bool ResultTable::AddColumnName(ub4 position) {
    void* column = nullptr;
    sword rc = Call(&ClientLibrary::OCIParamGet, statement_, ub4{OCI_HTYPE_STMT}, error_, &column, position);
    if (!Check(rc, Failed(rc))) return false;
    OraText* name = nullptr;
    ub4 length = 0;
    rc = Call(&ClientLibrary::OCIAttrGet, column, ub4{OCI_DTYPE_PARAM}, &name, &length, ub4{OCI_ATTR_NAME}, error_);
    if (!Check(rc, Failed(rc))) return false;
    AddText(line_, name, length, utf16_, Quotes::never);
    return true;
}

bool ResultTable::PrintHeader() {
    for (ub4 position = 1; position <= columns_; ++position) {
        if (!DefineColumn(position) || !AddColumnName(position)) return false;
        if (position < columns_) line_.Character(',');
    }
    width_ = line_.Length();
    line_.Character('\n').Print();
    PrintUnderline();
    return true;
}

void ResultTable::PrintUnderline() {
    line_.Text(std::string(width_, '-')).Character('\n').Print();
}

void ResultTable::PrintFooter() {
    PrintUnderline();
    Message(kOutput, "Number of rows fetched - %ld\n", rows_);
}

// --- Rows ------------------------------------------------------------------------------------------------------------

sword ResultTable::Fetch() {
    return Call(&ClientLibrary::OCIStmtFetch, statement_, error_, ub4{1}, ub2{OCI_FETCH_NEXT}, ub4{OCI_DEFAULT});
}

sword ResultTable::AskForPiece() {
    ub1 direction = 0;
    ub4 iteration = 0;
    ub4 index = 0;
    return Call(&ClientLibrary::OCIStmtGetPieceInfo, statement_, error_, &define_, &define_type_, &direction,
                &iteration, &index, &piece_);
}

bool ResultTable::ReceivePiece() {
    length_ = kPieceSize;
    indicator_ = 0;
    const sword rc = Call(&ClientLibrary::OCIStmtSetPieceInfo, define_, define_type_, error_, buffer_.get(), &length_,
                          piece_, &indicator_, &return_code_);
    if (!Check(rc, Failed(rc))) return false;
    fetched_ = Fetch();
    if (!Check(fetched_, Failed(fetched_) && fetched_ != OCI_NEED_DATA && fetched_ != OCI_NO_DATA)) return false;
    length_ = std::min(length_, kPieceSize);
    if (indicator_ != OCI_IND_NULL) TakePiece();
    return true;
}

void ResultTable::TakePiece() {
    const char* const text = buffer_.get();
    if (utf16_) value_.append(text, utf::Utf16Length(text, length_));
    else line_.Text({text, strnlen(text, length_)});
}

void ResultTable::EndValue(ub4 column) {
    if (indicator_ == OCI_IND_NULL) line_.Character('-');
    else if (utf16_) AddText(line_, value_.data(), value_.size(), true, Quotes::never);
    line_.Character(column < columns_ ? ',' : '\n');
}

// A value that a piece does not hold goes on in the next one. Which value the next piece belongs to is known once it is
// asked for; behind the last column nothing is, unless the library has more.
bool ResultTable::ReceiveValue(ub4 column) {
    value_.clear();
    sword rc = OCI_SUCCESS;
    for (bool goes_on = true; goes_on;) {
        const void* const define = define_;
        if (!ReceivePiece()) return false;
        if (column == columns_ && fetched_ != OCI_NEED_DATA) break;
        rc = AskForPiece();
        goes_on = define_ == define && (piece_ == OCI_NEXT_PIECE || piece_ == OCI_LAST_PIECE) && length_ > 0 &&
                  !Failed(rc);
    }
    EndValue(column);
    return Check(rc, Failed(rc));
}

bool ResultTable::PrintRow() {
    const sword rc = AskForPiece();
    if (!Check(rc, Failed(rc))) return false;
    for (ub4 column = 1; column <= columns_; ++column)
        if (!ReceiveValue(column)) return false;
    line_.Print();
    return true;
}

bool ResultTable::PrintRows(long most_rows) {
    for (;;) {
        const sword rc = Fetch();
        if (rc == OCI_ERROR) ReturnCodeReport(error_, rc);
        if (rc == OCI_ERROR || rc == OCI_NO_DATA) return true;
        if (!PrintRow()) return false;
        if (fetched_ != OCI_SUCCESS) return true;
        if (++rows_ >= most_rows) return true;
    }
}

void FetchAll(const CommandRow&, int count, char** words) {
    constexpr long kAllRows = 99999999;
    ResultTable table(Resolve<OCIStmt>(Kind::stmt, words[1]));
    const long most_rows = count > 2 ? DecodeLong(words[2]) : kAllRows;
    if (table.Describe() && table.PrintHeader() && table.PrintRows(most_rows)) table.PrintFooter();
}

constexpr PlainCommand kFetchAllCommands[] = {
    {{Code::fetchalloci, Words(2, 3), "FetchAllOCI hStmt [maxrows]"}, FetchAll},
};

}  // namespace

void AddFetchAllCommand(HandlerTable& handlers) {
    handlers.Add(kFetchAllCommands);
}
