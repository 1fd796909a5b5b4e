// Statement handles: text, binds and defines, execution, the open result, pieces in progress. The parts of the class
// are in files of their own: statement.cpp (text, binds, defines), execute.cpp, block.cpp, fetch.cpp, pieces.cpp,
// statement_attributes.cpp.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
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
    // The area must be the one that GetPieceInfo names.
    Status SetPieceInfo(DataArea& area, const PieceBuffer& piece);

    // The statement cache (statement_cache.h): whether prepare2 made the handle; the cache that keeps it, or null, and
    // the key it is kept under.
    bool from_prepare2 = false;
    class StatementCache* kept_in = nullptr;
    std::string cache_key;
    // What holds between release and the next prepare2: no open rows, no pieces in progress.
    void Rest() noexcept;
    void Join(const std::shared_ptr<Link>& link) { Use(link); }
    [[nodiscard]] StatementCache* Cache() const;    // of the session; null when it is off

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
        values::ByKind<values::Renderer> renderers;    // of defines in pieces
    };
    // An execute or fetch that goes on when the application has supplied a piece or a buffer for one.
    struct Pieces {
        enum class Kind : std::uint8_t { none, fetch, execute };
        Kind kind = Kind::none;
        bool continued = false;         // the value at hand has begun
        // fetch
        bool by_execute = false;        // goes on with the next execute, not fetch
        bool is_null = false;
        ub4 rows = 0;
        ub4 row = 0;
        std::size_t active = 0;         // index of the define that takes the value
        std::string_view whole, rest;   // the value, and what of it is still to be taken
        // execute
        std::vector<Bind*> binds;       // that take pieces, in order of the placeholders
        std::size_t bind = 0;
        ExecuteArguments arguments{};
        ub4 iteration = 0;
        engine::ArrayOutcome outcome;
    };
    enum class State : std::uint8_t { initialized = 1, executed = 2, end_of_fetch = 3 };
    class Rows;    // the RowSource over the binds

    // statement.cpp
    Status MakeBind(OCIBind** handle, const BindArguments& arguments, Bind*& bind);
    void SetBound(std::size_t placeholder, Bind& bind);
    void SetBoundByName(std::uint32_t first, Bind& bind);
    void ReleaseBinds() noexcept;
    void ReleaseDefines() noexcept;
    const std::string& KeptName(std::size_t placeholder, bool indicator);
    void Drop() noexcept;    // what is compiled and open
    void CloseCursor() noexcept;

    // execute.cpp
    engine::Connection& Engine() const { return UsedLink()->Engine(); }
    Status Ready(ServiceContext& service, const ExecuteArguments& arguments);
    Status Compile(std::size_t step, Compiled*& compiled);
    Status ParseOnly();
    Status DescribeOnly();
    Status Run(ErrorHandle& error, const ExecuteArguments& arguments);
    Status Complete(Status status, const ExecuteArguments& arguments);
    Status RunQuery(const ExecuteArguments& arguments);
    Status RunChange(ErrorHandle& error, const ExecuteArguments& arguments);
    Status RunRows(const ExecuteArguments& arguments, engine::ArrayOutcome& outcome);
    Status ReturnRow(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row, std::uint64_t& count);
    Status RunOnce(const ExecuteArguments& arguments);
    Status RunControl(const ExecuteArguments& arguments);
    Status Finish(ErrorHandle& error, const ExecuteArguments& arguments, engine::ArrayOutcome& outcome);
    Status FetchAtExecute(const ExecuteArguments& arguments);
    Status StoreTargets(const sql::Step& step, engine::Query& query, std::span<const engine::Datum> row,
                        std::size_t index);

    // block.cpp
    Status RunBlock(const ExecuteArguments& arguments);
    Status RunSteps(const ExecuteArguments& arguments);
    Status RunText(std::string_view sql);
    Status RunStep(std::size_t index, ub4 row);
    Status OpenCursor(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row);
    Status RunElement(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row, std::size_t element);
    Status SelectInto(Compiled& compiled, Rows& rows, const sql::Step& step, std::size_t element, ub4 row);
    Status SelectIntoTables(Compiled& compiled, Rows& rows, const sql::Step& step);
    bool IntoTables(const sql::Step& step) const;

    // fetch.cpp
    const std::vector<engine::Column>* Columns();    // null when there are none
    Status CheckFetch() const;
    Status ActivateDefines();
    Status GoToFirst(ub2 orientation, sb4 offset, bool& found);
    Status FetchRows(ub4 rows, ub4 first, bool at_first);
    int StoreRow(ub4 index);
    Status EndOfFetch();

    // pieces.cpp
    Status StartFetchInPieces(ub4 rows, bool at_first, bool by_execute);
    Status NextRowInPieces(bool at_row);
    bool NextDefineInPieces(std::size_t from, int& error);
    Status ContinueFetch();
    Status StartExecuteInPieces(const ExecuteArguments& arguments);
    Status ContinueExecute(ErrorHandle& error);
    Status RunCollected(ErrorHandle& error);

    std::string text_;
    sql::StatementText scanned_;
    bool prepared_ = false;
    std::vector<Bind*> bound_;          // by placeholder
    std::vector<std::string> kept_names_;
    std::vector<Define*> defined_;      // by position - 1
    std::vector<Define*> released_;     // of the text before: may be used again until the next
    std::vector<Compiled> compiled_;    // by step
    std::vector<Parameter*> parameters_;    // by position - 1, as handed out
    Cursor cursor_;
    std::vector<ActiveDefine> active_;
    bool defines_changed_ = true;       // since active_ was made
    bool fetches_in_pieces_ = false;    // some active define does
    Pieces pieces_;

    State state_ = State::initialized;
    bool described_ = false;
    bool failed_ = false;       // the last execute
    bool cancelled_ = false;    // the result was given up
    bool link_lost_ = false;
    std::uint64_t row_count_ = 0;
    std::uint32_t rows_fetched_ = 0;
    std::uint32_t failed_rows_ = 0;
    std::int64_t last_row_ = 0;    // the engine's number of the last row that the execute touched
    std::uint32_t parse_error_offset_ = 0;    // in the UTF-8 text
};
