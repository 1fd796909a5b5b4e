// Statements: text, binds and defines, and what hangs on the link.
#include "statements/statement.h"

#include <utility>

#include "handles/errors.h"
#include "handles/gate.h"
#include "statements/statement_cache.h"

namespace {

constexpr std::uint32_t kMostColumns = 65535;

constexpr ub4 kBindModes = OCI_SB2_IND_PTR | OCI_DATA_AT_EXEC | OCI_PIECEWISE | OCI_BIND_SOFT | OCI_IOV;
constexpr ub4 kDefineModes = OCI_DYNAMIC_FETCH | OCI_DEFINE_SOFT | OCI_IOV;

}  // namespace

Statement::~Statement() {
    if (share_) share_->Leave();
    if (kept_in) kept_in->Forget(*this);
    Drop();
}

std::shared_ptr<std::recursive_mutex> Statement::Serial() { return LinkSerial(); }

const std::shared_ptr<StatementShare>& Statement::Share() {
    if (!share_) share_ = std::make_shared<StatementShare>(*this);
    return share_;
}

// What is open and compiled goes before the link does. One that rests in the cache goes, or stays, with the connection.
void Statement::LinkClosed() noexcept {
    if (kept_in) return;
    Drop();
    run_.fetch_error = errors::kNotConnected;
}

// An open result is gone with the connection; what was executed counts as before.
void Statement::ConnectionChanged() noexcept {
    if (run_.cursor.IsOpen()) run_.fetch_error = errors::kFetchOutOfSequence;
    Drop();
}

void Statement::Drop() noexcept {
    CloseCursor();
    pieces_.End();
    compiled_.clear();
}

// The session counts its open results.
void Statement::CloseCursor() noexcept {
    if (run_.cursor.IsOpen()) --UsedLink()->open_statements;
    run_.cursor.Close();
}

void Statement::StartAnew() noexcept {
    CloseCursor();
    pieces_.End();
    defines_.Renew();
    run_ = Execution();
}

void Statement::Rest() noexcept {
    StartAnew();
    described_ = false;
}

StatementCache* Statement::Cache() const {
    const std::shared_ptr<Link>& link = UsedLink();
    auto* cache = link ? static_cast<StatementCache*>(link->statement_cache.get()) : nullptr;
    return cache && cache->Capacity() > 0 ? cache : nullptr;
}

Status Statement::Prepare(std::string_view text) {
    sql::StatementText scanned = sql::Scan(text);
    std::vector<std::shared_ptr<BindArea>> places(scanned.placeholders.size());
    std::string copy(text);
    Drop();
    StartAnew();
    text_.Release(*this);
    defines_.Retire(*this);
    text_.Take(std::move(copy), std::move(scanned), std::move(places));
    described_ = false;
    parse_error_offset_ = 0;
    return {};
}

// ---- Binds and defines

// The living handle behind the application's pointer, which may be anything, if it may serve a position: it is free, or
// has the position in this statement already. Null when a new one is to be made; one that serves elsewhere keeps its
// place.
template <class H, class Handle>
H* Statement::Reusable(Handle* handle, ub4 position) const {
    H* living = Live<H>(handle);
    if (!living) return nullptr;
    const std::shared_ptr<StatementShare> owner = living->area->Owner();
    if (owner && owner->IsLiving()) return owner == share_ && living->area->position == position ? living : nullptr;
    const bool of_a_statement = living->Parent() != &living->Env();
    return !of_a_statement || living->Parent() == this ? living : nullptr;
}

Status Statement::MakeBind(OCIBind** handle, std::uint32_t placeholder, bool all_of_name, ub4 position,
                           const BindArguments& arguments) {
    if (arguments.mode & ~kBindModes) return Error(errors::kBadMode);
    if (arguments.current_elements && arguments.most_elements > 0 &&
        *arguments.current_elements > arguments.most_elements)
        return Error(errors::kBadTableLength);
    const auto& share = Share();
    Bind* bind = Reusable<Bind>(*handle, position);
    const bool is_new = !bind;
    const std::uint32_t changes = text_.Changes();
    if (is_new) bind = Create<Bind>(*this, OCI_HTYPE_BIND, 0);
    if (text_.Changes() != changes) return Error(errors::kIllegalOperation);    // by a memory function
    BindArea& area = *bind->area;
    Status status = area.Assign(arguments.area, arguments.mode & OCI_DATA_AT_EXEC);
    if (!status.Ok()) {
        if (is_new) Destroy(bind);
        return status;
    }
    pieces_.End();    // an operation that waits for a piece is given up
    area.SetOwner(share);
    area.position = position;
    area.most_elements = arguments.most_elements;
    area.current_elements = arguments.current_elements;
    *handle = AsHandle<OCIBind>(bind);
    text_.Bind(placeholder, all_of_name, bind->area, *this);
    return {};
}

Status Statement::BindByName(OCIBind** handle, std::string_view written, const BindArguments& arguments) {
    if (!handle) return Error(errors::kNullArgument);
    if (!text_.IsSet()) return Error(errors::kNotPrepared);
    const std::uint32_t* first = text_.FindName(written);
    if (!first) return Error(errors::kNoSuchBind);
    return MakeBind(handle, *first, true, *first + 1, arguments);
}

Status Statement::BindByPosition(OCIBind** handle, ub4 position, const BindArguments& arguments) {
    if (!handle) return Error(errors::kNullArgument);
    if (!text_.IsSet()) return Error(errors::kNotPrepared);
    const std::uint32_t* placeholder = text_.FindPosition(position);
    if (!placeholder) return Error(errors::kNoSuchBind);
    return MakeBind(handle, *placeholder, Scanned().is_block, position, arguments);
}

Status Statement::DefineByPosition(OCIDefine** handle, ub4 position, const AreaArguments& arguments, ub4 mode) {
    if (!handle) return Error(errors::kNullArgument);
    if (!text_.IsSet() && !HasResult()) return Error(errors::kNotPrepared);
    if (position == 0 || position > kMostColumns) return Error(errors::kIllegalDefinePosition);
    if (mode & ~kDefineModes) return Error(errors::kBadMode);
    const bool in_pieces = mode & OCI_DYNAMIC_FETCH;
    if (!in_pieces && !arguments.value) return Error(errors::kNullArgument);
    const auto& share = Share();
    defines_.Reserve(position);
    Define* define = Reusable<Define>(*handle, position);
    const bool is_new = !define;
    if (is_new) define = Create<Define>(*this, OCI_HTYPE_DEFINE, 0);
    Status status = define->area->Assign(arguments, in_pieces);
    if (!status.Ok()) {
        if (is_new) Destroy(define);
        return status;
    }
    pieces_.End();
    defines_.Reserve(position);    // a memory function may have prepared anew
    define->area->SetOwner(share);
    define->area->position = position;
    *handle = AsHandle<OCIDefine>(define);
    defines_.Put(position, define->area, *this);
    return {};
}

Status Statement::GetBindInfo(const BindInfo& info) {
    return text_.IsSet() ? text_.Describe(info, Env()) : Error(errors::kNotPrepared);
}
