#include "statements/targets.h"

#include <algorithm>

#include "handles/errors.h"
#include "values/lobs.h"

Status Targets::FindPlaces(std::size_t columns) {
    const std::size_t count = std::min(step_.targets.size(), columns);
    places_.reserve(count);
    for (std::size_t target = 0; target < count; ++target) {
        if (!text_.IsBound(step_.targets[target])) return Error(errors::kNotAllBound);
        BindArea& bind = *text_.At(step_.targets[target]);
        bind.workspace.column = values::ClassOf(query_.Columns()[target].type);
        bind.workspace.lobs = text_.lobs;
        Place& place = places_.emplace_back(Place{&bind, values::ForColumn(*bind.Type()->out, bind.workspace.column), {}});
        if (bind.InPieces()) place.renderers = values::ForColumn(*bind.Type()->pieces, bind.workspace.column);
    }
    return {};
}

// A value that goes out in pieces, in the application's form.
int Targets::Keep(const Place& place, std::uint32_t element, const engine::Datum& value) {
    BindArea& bind = *place.bind;
    if (bind.out.size() <= element) bind.out.resize(std::size_t{element} + 1);
    WholeValue& whole = bind.out[element];
    whole.is_given = true;
    whole.is_null = value.kind == engine::Kind::null;
    whole.bytes.clear();
    whole.object = nullptr;
    if (whole.is_null) return 0;
    if (value.kind == engine::Kind::lob) {
        const int error = values::TakeLong(value, text_.lobs.get(), whole.object);
        if (whole.object && !OutgoingValue::Streams(bind, whole.object->Kind())) whole.object = nullptr;
        if (error != 0 || whole.object) return error;
    }
    std::string_view text;
    int error = place.renderers[static_cast<std::size_t>(value.kind)](value, bind.workspace, text);
    if (error == 0 && bind.Type()->family == values::Family::text)
        error = values::ToApplication(text, bind.workspace, text);
    if (error == 0) whole.bytes = text;
    return error;
}

void Targets::Settle() {
    for (const Place& place : places_) {
        if (!place.bind->InPieces()) continue;
        std::vector<WholeValue>&in = place.bind->in, &out = place.bind->out;
        if (in.size() < out.size()) in.resize(out.size());
        for (std::size_t element = 0; element < out.size(); ++element)
            if (out[element].is_given) in[element] = std::move(out[element]);
        out.clear();
    }
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
        const Place& place = places_[target];
        const bool is_block = text_.Scanned().is_block;
        const int error = bind.InPieces()
                              ? Keep(place, !is_block ? rows_ : bind.IsTable() ? element : 0, values[target])
                              : values::Store(bind.elements, element, place.converters, bind.workspace, values[target]);
        if (error != 0 && error != errors::kTruncationWarning) return Error(error);
    }
    of_execution_ = execution == execution_ && rows_ > 0 ? of_execution_ + 1 : 1;
    execution_ = execution;
    ++rows_;
    return {};
}
