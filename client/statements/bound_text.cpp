#include "statements/bound_text.h"

#include <algorithm>
#include <utility>

#include "handles/environment.h"
#include "handles/errors.h"

void BoundText::Take(std::string&& text, sql::StatementText&& scanned,
                     std::vector<std::shared_ptr<BindArea>>&& places) noexcept {
    text_ = std::move(text);
    scanned_ = std::move(scanned);
    bound_ = std::move(places);
    kept_names_.clear();
    is_set_ = true;
}

bool BoundText::AnyInPieces() const {
    return std::any_of(bound_.begin(), bound_.end(),
                       [](const auto& bind) { return bind && bind->InPieces() && bind->HasHandle(); });
}

const std::uint32_t* BoundText::FindName(std::string_view written) const {
    const std::string name = sql::PlaceholderName(written);
    const auto& all = scanned_.placeholders;
    const auto found = std::find_if(all.begin(), all.end(), [&](const sql::Placeholder& p) { return p.name == name; });
    return found == all.end() ? nullptr : &found->first;
}

const std::uint32_t* BoundText::FindPosition(ub4 position) const {
    return position == 0 || position > scanned_.positions.size() ? nullptr : &scanned_.positions[position - 1];
}

void BoundText::Bind(std::uint32_t placeholder, bool all_of_name, const std::shared_ptr<BindArea>& area,
                     const Object& statement) {
    ++changes_;
    if (!all_of_name) return Put(placeholder, area, statement);
    for (std::size_t index = placeholder; index < bound_.size(); ++index)
        if (scanned_.placeholders[index].first == placeholder) Put(index, area, statement);
}

void BoundText::Put(std::size_t placeholder, const std::shared_ptr<BindArea>& area, const Object& statement) {
    const std::shared_ptr<BindArea> before = std::exchange(bound_[placeholder], area);
    if (before && before != area && std::find(bound_.begin(), bound_.end(), before) == bound_.end())
        ReleaseArea(*before, statement);
}

void BoundText::Release(const Object& statement) noexcept {
    ++changes_;
    for (const std::shared_ptr<BindArea>& bind : std::exchange(bound_, {}))
        if (bind) ReleaseArea(*bind, statement);
}

// A name as the application reads it; kept by the statement.
const std::string& BoundText::KeptName(std::size_t placeholder, bool indicator, const Environment& environment) {
    const sql::Placeholder& source = scanned_.placeholders[placeholder];
    const std::string& name = indicator ? source.indicator : source.name;
    if (!environment.Converts()) return name;
    if (kept_names_.size() < bound_.size() * 2) kept_names_.resize(bound_.size() * 2);
    std::string& kept = kept_names_[placeholder * 2 + indicator];
    TextOut(environment, name, kept);
    return kept;
}

Status BoundText::Describe(const BindInfo& info, const Environment& environment) {
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
        const std::string& name = KeptName(placeholder, false, environment);
        const std::string& indicator = KeptName(placeholder, true, environment);
        if (info.names) info.names[index] = text(name);
        if (info.name_lengths) info.name_lengths[index] = length(name);
        if (info.indicators) info.indicators[index] = text(indicator);
        if (info.indicator_lengths) info.indicator_lengths[index] = length(indicator);
        if (info.repeated) info.repeated[index] = scanned_.placeholders[placeholder].first != placeholder;
        if (info.binds)
            info.binds[index] = AsHandle<OCIBind>(bound_[placeholder] ? bound_[placeholder]->Handle() : nullptr);
    }
    if (info.found) {
        const bool all = first + count == total;
        *info.found = all ? static_cast<sb4>(count) : -static_cast<sb4>(total);
    }
    return {};
}
