// Statement handles. A statement is a text with its binds (bound_text.h), defines (defines.h), what the engine compiled
// of the text, one execution at a time (execution.h), and perhaps an operation that waits for pieces (piece_stream.h).
// The class puts them together; its parts are in files of their own: statement.cpp (text, binds, defines), execute.cpp,
// block.cpp, fetch.cpp, pieces.cpp, statement_attributes.cpp.
//
// Handles that belong to a statement refer to it through what they share (share.h). No call changes another statement,
// but for the result that a block gives it, and that under its lock.
//
// Threads: calls hold the serial lock of the statement's link; an execute, which may join another link, that one's, too.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "describe/parameter.h"
#include "engine/engine.h"
#include "handles/error_handle.h"
#include "handles/object.h"
#include "oci.h"
#include "sessions/link.h"
#include "sql/engine_text.h"
#include "statements/bind.h"
#include "statements/bind_rows.h"
#include "statements/bound_text.h"
#include "statements/define.h"
#include "statements/defines.h"
#include "statements/execution.h"
#include "statements/kept_row.h"
#include "statements/piece_stream.h"
#include "statements/share.h"
#include "statements/targets.h"

class ServiceContext;

class Statement : public Object, public LinkUser {
public:
    static constexpr Kind kKind = Kind::statement;
    explicit Statement(const Origin& origin) : Object(origin) {}
    ~Statement() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;
    // Stands for it while it is of no session; as long as the handle, which goes behind all calls that may know it.
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> LockAlone() { return {std::shared_ptr<void>(), &alone_}; }
    void LinkClosed() noexcept override;
    void ConnectionChanged() noexcept override;

    // What every call on the statement's handle asks first: 3127 while a callback of it runs.
    [[nodiscard]] Status Admit() const { return pieces_.Asks() ? Error(errors::kOperationActive) : Status(); }

    // Text. Binds and defines made before are no longer part of the statement.
    Status Prepare(std::string_view text);
    [[nodiscard]] const std::string& Text() const { return text_.Text(); }

    // Binds and defines. `handle` is in and out: one that lives and is free, or is made anew for the same place, is
    // used; else there is a new one.
    struct BindArguments {
        AreaArguments area;
        ub4 most_elements;
        ub4* current_elements;
        ub4 mode;
    };
    Status BindByName(OCIBind** handle, std::string_view name, const BindArguments& arguments);
    Status BindByPosition(OCIBind** handle, ub4 position, const BindArguments& arguments);
    Status DefineByPosition(OCIDefine** handle, ub4 position, const AreaArguments& arguments, ub4 mode);
    Status GetBindInfo(const BindInfo& info);

    // Running and fetching. Execute wants the locks of ExecuteLocks.
    Status Execute(const ExecuteTarget& target, ErrorHandle& error, const ExecuteArguments& arguments);
    Status Fetch(ErrorHandle& error, ub4 rows, ub2 orientation, sb4 offset);
    [[nodiscard]] bool HasResult() const { return run_.cursor.IsOpen(); }
    // The statements that a block would give results to, as far as they are there.
    void CollectResultTargets(const ExecuteArguments& arguments, std::vector<Statement*>& targets) const;
    Status GetParameter(ub4 position, dvoid** out);

    // Pieces: the one that is wanted next, or null; and its place, which must be that of the wanted piece's handle.
    [[nodiscard]] const WantedPiece* Wanted() noexcept {
        return pieces_.Wants() == PieceStream::Use::none ? nullptr : &pieces_.Wanted();
    }
    Status SetPlace(DataArea& area, const PieceBuffer& place) { return pieces_.SetPlace(area, place); }

    // The statement cache (statement_cache.h): whether prepare2 made the handle; the cache that keeps it, or null, and
    // the key it is kept under.
    bool from_prepare2 = false;
    class StatementCache* kept_in = nullptr;
    std::string cache_key;
    // What holds between release and the next prepare2: no open rows, no pieces in progress, no counts.
    void Rest() noexcept;
    void Join(const std::shared_ptr<Link>& link) { Use(link); }
    [[nodiscard]] StatementCache* Cache() const;    // of the session; null when it is off

    std::unique_ptr<KeptRow> kept_row;    // null: nobody wants it

    // Attributes that are only kept.
    std::uint32_t prefetch_rows = 1;
    std::uint32_t prefetch_memory = 0;
    std::uint32_t nested_prefetch_rows = 0;
    std::uint32_t nested_prefetch_memory = 0;

private:
    friend struct StatementAttributes;

    // A step as the engine compiled it, with the binds that it reads.
    struct Compiled {
        bool rewritten = false;
        sql::EngineText text;
        std::vector<engine::Kind> kinds;    // that the engine was told
        std::unique_ptr<engine::Query> query;
        BindRows rows;
    };
    class FetchSink;    // into the defines, and to the pieces
    class Stretch;      // what a block did since the transaction's last end

    // statement.cpp
    const std::shared_ptr<StatementShare>& Share();
    template <class H, class Handle>
    H* Reusable(Handle* handle, ub4 position) const;
    Status MakeBind(OCIBind** handle, std::uint32_t placeholder, bool all_of_name, ub4 position,
                    const BindArguments& arguments);
    void Drop() noexcept;    // what is compiled and open
    void CloseCursor() noexcept;
    void StartAnew() noexcept;    // the execution
    // Becomes a statement that has the query's rows to fetch.
    void TakeResult(std::unique_ptr<engine::Query> query, const std::shared_ptr<Link>& link);

    // execute.cpp
    [[nodiscard]] engine::Connection& Engine() const { return UsedLink()->Engine(); }
    [[nodiscard]] const sql::StatementText& Scanned() const { return text_.Scanned(); }
    Status ExecuteNow(const ExecuteTarget& target, ErrorHandle& error, const ExecuteArguments& arguments);
    Status Ready(const ExecuteTarget& target, const ExecuteArguments& arguments);
    Status Compile(std::size_t step, Compiled*& compiled);
    Status CompileForValues(Compiled*& compiled);
    Status ParseOnly();
    Status DescribeOnly();
    Status Run(ErrorHandle& error, const ExecuteArguments& arguments);
    Status Complete(Status status, const ExecuteArguments& arguments);
    Status RunQuery(const ExecuteArguments& arguments);
    Status RunChange(ErrorHandle& error, const ExecuteArguments& arguments);
    Status RunRows(const ExecuteArguments& arguments);
    void ForgetOutcome() noexcept;
    Status RunOnce(const ExecuteArguments& arguments);
    Status RunControl(const ExecuteArguments& arguments);
    Status Finish(ErrorHandle& error, const ExecuteArguments& arguments);
    Status FetchAtExecute(const ExecuteArguments& arguments);
    Status EndExactFetch(Status status, const ExecuteArguments& arguments);
    void AddNotices(ErrorHandle& error, Status& status);

    // block.cpp
    Status RunBlock(const ExecuteArguments& arguments);
    Status RunSteps(const ExecuteArguments& arguments, Stretch& stretch);
    Status RunStep(std::size_t index, ub4 row, Stretch& stretch);
    Status RunElement(Compiled& compiled, const sql::Step& step, ub4 row, ub4 element);
    Status OpenResult(Compiled& compiled, const sql::Step& step, ub4 row);
    Status SelectInto(Compiled& compiled, Targets& targets, ub4 row);
    Status SelectIntoTables(Compiled& compiled, const sql::Step& step, ub4 row);
    Status Change(Compiled& compiled, const sql::Step& step, ub4 row, ub4 element);
    Status Savepoint(Compiled& compiled, const sql::Step& step, ub4 row, Stretch& stretch);
    [[nodiscard]] bool IntoTables(const sql::Step& step) const;
    void SetReturned(const sql::Step& step, std::uint32_t rows);

    // fetch.cpp
    const std::vector<engine::Column>* Columns();    // null when there are none
    Status FetchNow(ub4 rows, ub2 orientation, sb4 offset);
    Status CheckFetch();
    Status FindFirst(ub2 orientation, sb4 offset, std::uint64_t& position);
    Status FetchRows(ub4 rows, ub4 first, const std::uint64_t* position);
    Status EndOfFetch();
    Status StartFetchInPieces(ub4 rows, ub4 first, const std::uint64_t* position, const ExecuteArguments* execute);
    Status NextRowInPieces(ub4 row, const std::uint64_t* position);
    Status ContinueFetch();

    // pieces.cpp
    Status StartExecuteInPieces(ErrorHandle& error, const ExecuteArguments& arguments);
    Status ContinueExecute(ErrorHandle& error);
    Status RunIterations(ub4& row);
    Status RunCollected(bool& stopped);
    Status RunAndDeliver(bool& stopped);
    [[nodiscard]] bool RunsByIteration() const;

    std::shared_ptr<StatementShare> share_;    // once a handle needs it
    std::recursive_mutex alone_;
    BoundText text_;
    Defines defines_;
    std::vector<Compiled> compiled_;    // by step; lives on the link
    bool described_ = false;            // the select list is known, executed or not
    std::uint32_t parse_error_offset_ = 0;    // in the UTF-8 text
    Execution run_;
    PieceStream pieces_{this};
    engine::ArrayOutcome outcome_;    // of the execute; of one in pieces, what its iterations did so far
    Status told_;    // by a block in pieces so far: a warning that stops nothing
    CallbackDriver driver_;
    Parameters parameters_;    // by position - 1
};
