#include "statements/targets.h"

#include <algorithm>

#include "handles/errors.h"

Status Targets::FindPlaces(std::size_t columns) {
    const std::size_t count = std::min(step_.targets.size(), columns);
    places_.reserve(count);
    for (std::size_t target = 0; target < count; ++target) {
        if (!text_.IsBound(step_.targets[target])) return Error(errors::kNotAllBound);
        BindArea& bind = *text_.At(step_.targets[target]);
        bind.workspace.column = values::ClassOf(query_.Columns()[target].type);
        places_.push_back({&bind, values::ForColumn(*bind.Type()->out, bind.workspace.column)});
    }
    return {};
}

// How many rows there is room for.
std::uint32_t Targets::Most() const {
    if (layout_ == Layout::one_row) return 1;
    std::uint32_t most = ~std::uint32_t{0};
    for (const Place& place : places_) most = std::min(most, place.bind->IsTable() ? place.bind->most_elements : 1);
    return most;
}

Status Targets::Row(std::uint32_t execution, std::span<const engine::Datum> values) {
    if (rows_ == 0) {
        places_.clear();
        if (Status status = FindPlaces(values.size()); !status.Ok()) return status;
    }
    if (layout_ != Layout::each_execution && rows_ >= Most())
        return Error(layout_ == Layout::one_row ? errors::kTooManyRows : errors::kBadTableLength);
    const bool by_execution = layout_ == Layout::each_execution;
    for (std::size_t target = 0; target < places_.size(); ++target) {
        BindArea& bind = *places_[target].bind;
        const std::uint32_t table = layout_ == Layout::tables ? rows_ : table_;
        const std::uint32_t element = bind.IsTable() ? table : by_execution ? execution : plain_;
        const int error = values::Store(bind.elements, element, places_[target].converters, bind.workspace, values[target]);
        if (error != 0 && error != errors::kTruncationWarning) return Error(error);
    }
    of_execution_ = execution == execution_ && rows_ > 0 ? of_execution_ + 1 : 1;
    execution_ = execution;
    ++rows_;
    return {};
}
