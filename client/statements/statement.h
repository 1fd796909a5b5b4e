// Statement handles: text, binds and defines, execution, the open result, pieces in progress. The parts of the class are
// in files of their own: statement.cpp (text, binds, defines), execute.cpp, block.cpp, fetch.cpp, pieces.cpp,
// statement_attributes.cpp.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "handles/error_handle.h"
#include "handles/object.h"
#include "oci.h"
#include "sessions/link.h"
#include "sql/engine_text.h"
#include "sql/statement_text.h"
#include "statements/bind.h"
#include "statements/cursor.h"
#include "statements/define.h"

class Parameter;
class ServiceContext;

struct ExecuteArguments {
    ub4 iterations;
    ub4 first;    // row offset
    ub4 mode;
};

// One placeholder of a step with what is bound to it.
struct BoundPlaceholder {
    Bind* bind;
    bool is_row_id;
};

class Statement : public Object, public LinkUser {
public:
    static constexpr Kind kKind = Kind::statement;
    explicit Statement(const Origin& origin) : Object(origin) {}
    ~Statement() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;
    void LinkClosed() noexcept override;

    // Text. Binds and defines made before are no longer part of the statement.
    Status Prepare(std::string_view text);
    [[nodiscard]] bool Prepared() const { return prepared_; }
    [[nodiscard]] const std::string& Text() const { return text_; }

    // Binds and defines. `handle` is in and out: what is no living handle is replaced by a new one.
    struct BindArguments {
        AreaArguments area;
        ub4 most_elements;
        ub4* current_elements;
        ub4 mode;
    };
    Status BindByName(OCIBind** handle, std::string_view name, const BindArguments& arguments);
    Status BindByPosition(OCIBind** handle, ub4 position, const BindArguments& arguments);
    Status DefineByPosition(OCIDefine** handle, ub4 position, const AreaArguments& arguments, ub4 mode);
    struct BindInfo {
        ub4 size;
        ub4 first;    // from 1
        sb4* found;
        OraText** names;
        ub1* name_lengths;
        OraText** indicators;
        ub1* indicator_lengths;
        ub1* repeated;
        OCIBind** binds;
    };
    Status GetBindInfo(const BindInfo& info);
    void Forget(const Bind& bind) noexcept;
    void Forget(const Define& define) noexcept;
    void Forget(const Parameter& parameter) noexcept;

    // Running and fetching.
    Status Execute(ServiceContext& service, ErrorHandle& error, const ExecuteArguments& arguments);
    Status Fetch(ub4 rows, ub2 orientation, sb4 offset);
    // Becomes a statement that has the query's rows to fetch.
    void TakeResult(std::unique_ptr<engine::Query> query, const std::shared_ptr<Link>& link);
    [[nodiscard]] bool HasResult() const { return cursor_.IsOpen(); }
    Status GetParameter(ub4 position, dvoid** out);

    // Pieces.
    struct PieceInfo {
        dvoid* handle;
        ub4 type;
        ub1 direction;
        ub4 iteration;
        ub4 index;
        ub1 piece;
    };
    Status GetPieceInfo(PieceInfo& info) const;
    Status SetPieceInfo(DataArea& area, const PieceBuffer& piece);

    // The statement cache: whether prepare2 made the handle, and the key it was found under.
    bool from_prepare2 = false;
    std::string cache_key;

    // Attributes that are only kept.
    std::uint32_t prefetch_rows = 1;
    std::uint32_t prefetch_memory = 0;
    std::uint32_t nested_prefetch_rows = 0;
    std::uint32_t nested_prefetch_memory = 0;

private:
    friend struct StatementAttributes;

    // A step as the engine compiled it; lives on the link.
    struct Compiled {
        sql::EngineText text;
        std::unique_ptr<engine::Query> query;
    };
    // A define and the column it takes.
    struct ActiveDefine {
        Define* define;
        std::uint32_t column;
        values::ByKind<values::OutConverter> converters;
    };
    enum class State : std::uint8_t { initialized = 1, executed = 2, end_of_fetch = 3 };
    class Rows;    // the RowSource over the binds

    // statement.cpp
    Status CheckBindMode(const BindArguments& arguments) const;
    Status MakeBind(OCIBind** handle, const BindArguments& arguments, Bind*& bind);
    void Drop() noexcept;    // what was compiled and is open

    // execute.cpp
    Status CheckMode(ub4 mode) const;
    Status Compile(std::size_t step, Compiled*& compiled);
    Status CheckBound(const Compiled& compiled) const;
    Status Run(ErrorHandle& error, const ExecuteArguments& arguments);
    Status RunQuery(const ExecuteArguments& arguments);
    Status RunChange(ErrorHandle& error, const ExecuteArguments& arguments);
    Status RunReturning(Compiled& compiled, Rows& rows, const ExecuteArguments& arguments, engine::ArrayOutcome& outcome);
    Status RunDefinition(const ExecuteArguments& arguments);
    Status RunOther(const ExecuteArguments& arguments);
    Status RunControl(sql::Run run);
    Status Finish(ErrorHandle& error, const ExecuteArguments& arguments, engine::ArrayOutcome& outcome);
    Status FetchAtExecute(const ExecuteArguments& arguments);

    // block.cpp
    Status RunBlock(ErrorHandle& error, const ExecuteArguments& arguments);
    Status RunStep(std::size_t step, ub4 row);
    Status OpenCursor(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row);
    Status SelectInto(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row);

    // fetch.cpp
    Status ActivateDefines();
    Status FetchRows(ub4 rows, ub4 first);
    Status StoreRow(ub4 index);
    Status Position(ub2 orientation, sb4 offset, bool& found);
    Status EndOfFetch();

    // pieces.cpp
    Status StartPieces(ub4 rows);
    Status ContinueFetch();
    Status ContinueExecute(ErrorHandle& error);

    std::string text_;
    sql::StatementText scanned_;
    bool prepared_ = false;
    std::vector<Bind*> bound_;          // by placeholder
    std::vector<Define*> defined_;      // by position - 1
    std::vector<Compiled> compiled_;    // by step
    Cursor cursor_;
    State state_ = State::initialized;
};
