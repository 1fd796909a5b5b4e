// Statements: text, binds and defines, and what hangs on the link.
#include "statements/statement.h"

#include <algorithm>
#include <utility>

#include "handles/errors.h"
#include "handles/gate.h"
#include "statements/parameter.h"
#include "statements/statement_cache.h"

namespace {

constexpr std::uint32_t kMostColumns = 65535;

constexpr ub4 kBindModes = OCI_SB2_IND_PTR | OCI_DATA_AT_EXEC | OCI_PIECEWISE | OCI_BIND_SOFT | OCI_IOV;
constexpr ub4 kDefineModes = OCI_DYNAMIC_FETCH | OCI_DEFINE_SOFT | OCI_IOV;

// The living handle behind *handle, or null; the application's pointer may be anything.
template <class T, class Handle>
T* Existing(Handle** handle) { return Live<T>(*handle); }

}  // namespace

Statement::~Statement() {
    if (kept_in) kept_in->Forget(*this);
    Drop();
    for (Bind* bind : bound_)
        if (bind) bind->statement = nullptr;
    for (auto* defines : {&defined_, &released_})
        for (Define* define : *defines)
            if (define) define->statement = nullptr;
    for (Parameter* parameter : parameters_)
        if (parameter) parameter->statement = nullptr;
}

std::shared_ptr<std::recursive_mutex> Statement::Serial() { return LinkSerial(); }

// What is open and compiled goes before the link does.
void Statement::LinkClosed() noexcept {
    Drop();
    link_lost_ = true;
}

void Statement::Drop() noexcept {
    CloseCursor();
    pieces_ = {};
    compiled_.clear();
}

// Bind handles go with their text; those that the application allocated itself are only let loose.
void Statement::ReleaseBinds() noexcept {
    for (std::size_t index = 0; index < bound_.size(); ++index) {
        Bind* bind = std::exchange(bound_[index], nullptr);
        if (!bind || bind->statement != this) continue;
        bind->statement = nullptr;
        if (bind->Parent() != this) continue;
        std::replace(bound_.begin(), bound_.end(), bind, static_cast<Bind*>(nullptr));
        Destroy(bind);
    }
}

// Define handles outlive their text by one, since applications hand them in again for the next.
void Statement::ReleaseDefines() noexcept {
    for (Define* define : std::exchange(released_, std::move(defined_))) {
        if (!define) continue;
        define->statement = nullptr;
        if (define->Parent() == this) Destroy(define);
    }
    defined_.clear();
}

// The session counts its open results.
void Statement::CloseCursor() noexcept {
    if (cursor_.IsOpen()) --UsedLink()->open_statements;
    cursor_.Close();
}

void Statement::Rest() noexcept {
    CloseCursor();
    pieces_ = {};
    state_ = State::initialized;
    described_ = failed_ = cancelled_ = false;
    row_count_ = 0;
    rows_fetched_ = failed_rows_ = 0;
}

StatementCache* Statement::Cache() const {
    const std::shared_ptr<Link>& link = UsedLink();
    auto* cache = link ? static_cast<StatementCache*>(link->statement_cache.get()) : nullptr;
    return cache && cache->Capacity() > 0 ? cache : nullptr;
}

Status Statement::Prepare(std::string_view text) {
    sql::StatementText scanned = sql::Scan(text);
    std::vector<Bind*> bound(scanned.placeholders.size());
    text_ = text;
    Drop();
    ReleaseBinds();
    ReleaseDefines();
    bound_ = std::move(bound);
    kept_names_.clear();
    scanned_ = std::move(scanned);
    prepared_ = true;
    state_ = State::initialized;
    defines_changed_ = true;
    described_ = failed_ = cancelled_ = link_lost_ = false;
    row_count_ = 0;
    rows_fetched_ = failed_rows_ = parse_error_offset_ = 0;
    return {};
}

// ---- Binds

Status Statement::MakeBind(OCIBind** handle, const BindArguments& arguments, Bind*& bind) {
    if (arguments.mode & ~kBindModes) return Error(errors::kBadMode);
    if (arguments.current_elements && arguments.most_elements > 0 &&
        *arguments.current_elements > arguments.most_elements)
        return Error(errors::kBadTableLength);
    bind = Existing<Bind>(handle);
    const bool is_new = !bind;
    if (is_new) bind = Create<Bind>(*this, OCI_HTYPE_BIND, 0);
    Status status = bind->Assign(arguments.area, arguments.mode & OCI_DATA_AT_EXEC);
    if (!status.Ok()) {
        if (is_new) Destroy(bind);
        return status;
    }
    pieces_ = {};    // an operation that waits for a piece is given up
    if (bind->statement) bind->statement->Forget(*bind);
    bind->statement = this;
    bind->most_elements = arguments.most_elements;
    bind->current_elements = arguments.current_elements;
    *handle = AsHandle<OCIBind>(bind);
    return {};
}

// Puts the bind in the place of the one before, which goes when nothing else is bound to it.
void Statement::SetBound(std::size_t placeholder, Bind& bind) {
    Bind* before = std::exchange(bound_[placeholder], &bind);
    if (!before || before == &bind || std::find(bound_.begin(), bound_.end(), before) != bound_.end()) return;
    before->statement = nullptr;
    if (before->Parent() == this) Destroy(before);
}

// Every placeholder that repeats the name of the one at `first`.
void Statement::SetBoundByName(std::uint32_t first, Bind& bind) {
    bind.position = first + 1;
    for (std::size_t index = first; index < bound_.size(); ++index)
        if (scanned_.placeholders[index].first == first) SetBound(index, bind);
}

Status Statement::BindByName(OCIBind** handle, std::string_view written, const BindArguments& arguments) {
    if (!handle) return Error(errors::kNullArgument);
    if (!prepared_) return Error(errors::kNotPrepared);
    const std::string name = sql::PlaceholderName(written);
    const auto& all = scanned_.placeholders;
    const auto found = std::find_if(all.begin(), all.end(), [&](const sql::Placeholder& p) { return p.name == name; });
    if (found == all.end()) return Error(errors::kNoSuchBind);
    Bind* bind = nullptr;
    if (Status status = MakeBind(handle, arguments, bind); !status.Ok()) return status;
    SetBoundByName(found->first, *bind);
    return {};
}

Status Statement::BindByPosition(OCIBind** handle, ub4 position, const BindArguments& arguments) {
    if (!handle) return Error(errors::kNullArgument);
    if (!prepared_) return Error(errors::kNotPrepared);
    if (position == 0 || position > scanned_.positions.size()) return Error(errors::kNoSuchBind);
    Bind* bind = nullptr;
    if (Status status = MakeBind(handle, arguments, bind); !status.Ok()) return status;
    const std::uint32_t placeholder = scanned_.positions[position - 1];
    if (scanned_.is_block) {
        SetBoundByName(placeholder, *bind);
    } else {
        SetBound(placeholder, *bind);
    }
    bind->position = position;
    return {};
}

void Statement::Forget(const Bind& bind) noexcept {
    std::replace(bound_.begin(), bound_.end(), const_cast<Bind*>(&bind), static_cast<Bind*>(nullptr));
    if (pieces_.kind == Pieces::Kind::execute) pieces_ = {};
}

// ---- Defines

Status Statement::DefineByPosition(OCIDefine** handle, ub4 position, const AreaArguments& arguments, ub4 mode) {
    if (!handle) return Error(errors::kNullArgument);
    if (!prepared_ && !HasResult()) return Error(errors::kNotPrepared);
    if (position == 0 || position > kMostColumns) return Error(errors::kIllegalDefinePosition);
    if (mode & ~kDefineModes) return Error(errors::kBadMode);
    const bool in_pieces = mode & OCI_DYNAMIC_FETCH;
    if (!in_pieces && !arguments.value) return Error(errors::kNullArgument);
    auto* define = Existing<Define>(handle);
    const bool is_new = !define;
    if (is_new) define = Create<Define>(*this, OCI_HTYPE_DEFINE, 0);
    Status status = define->Assign(arguments, in_pieces);
    if (!status.Ok()) {
        if (is_new) Destroy(define);
        return status;
    }
    pieces_ = {};
    if (define->statement) define->statement->Forget(*define);
    if (defined_.size() < position) defined_.resize(position);
    Define* before = std::exchange(defined_[position - 1], define);
    if (before) before->statement = nullptr;
    if (before && before->Parent() == this) Destroy(before);
    define->statement = this;
    define->position = position;
    defines_changed_ = true;
    *handle = AsHandle<OCIDefine>(define);
    return {};
}

void Statement::Forget(const Define& define) noexcept {
    for (auto* defines : {&defined_, &released_})
        std::replace(defines->begin(), defines->end(), const_cast<Define*>(&define), static_cast<Define*>(nullptr));
    defines_changed_ = true;
    if (pieces_.kind == Pieces::Kind::fetch) pieces_ = {};
}

void Statement::Forget(const Parameter& parameter) noexcept {
    std::replace(parameters_.begin(), parameters_.end(), const_cast<Parameter*>(&parameter),
                 static_cast<Parameter*>(nullptr));
}

// ---- What there is to bind

// A name as the application reads it; kept by the statement.
const std::string& Statement::KeptName(std::size_t placeholder, bool indicator) {
    const sql::Placeholder& source = scanned_.placeholders[placeholder];
    const std::string& name = indicator ? source.indicator : source.name;
    if (!Env().Utf16()) return name;
    if (kept_names_.size() < bound_.size() * 2) kept_names_.resize(bound_.size() * 2);
    std::string& kept = kept_names_[placeholder * 2 + indicator];
    TextOut(Env(), name, kept);
    return kept;
}

Status Statement::GetBindInfo(const BindInfo& info) {
    if (!prepared_) return Error(errors::kNotPrepared);
    const std::size_t total = bound_.size();
    if (info.found) *info.found = 0;
    if (info.first == 0) return Error(errors::kNoSuchBind);
    if (info.first > total) return NoData();
    const std::size_t first = info.first - 1;
    const std::size_t count = std::min<std::size_t>(total - first, info.size);
    const auto length = [](const std::string& name) {
        constexpr std::size_t kLongest = 255;
        return static_cast<ub1>(std::min(name.size(), kLongest));
    };
    const auto text = [](const std::string& name) {
        return reinterpret_cast<OraText*>(const_cast<char*>(name.data()));
    };
    for (std::size_t index = 0; index < count; ++index) {
        const std::size_t placeholder = first + index;
        const std::string& name = KeptName(placeholder, false);
        const std::string& indicator = KeptName(placeholder, true);
        if (info.names) info.names[index] = text(name);
        if (info.name_lengths) info.name_lengths[index] = length(name);
        if (info.indicators) info.indicators[index] = text(indicator);
        if (info.indicator_lengths) info.indicator_lengths[index] = length(indicator);
        if (info.repeated) info.repeated[index] = scanned_.placeholders[placeholder].first != placeholder;
        if (info.binds) info.binds[index] = AsHandle<OCIBind>(bound_[placeholder]);
    }
    if (info.found) {
        const bool all = first + count == total;
        *info.found = all ? static_cast<sb4>(count) : -static_cast<sb4>(total);
    }
    return {};
}
