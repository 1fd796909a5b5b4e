// Parameters: handing them out.
#include "describe/parameter.h"

#include "handles/environment.h"
#include "handles/errors.h"

std::string_view ParameterSource::KeepText(std::string_view text) {
    const auto found = texts_.find(text);
    return found != texts_.end() ? *found : *texts_.emplace(text).first;
}

Parameter& Parameters::At(std::size_t place, Object& parent, const std::shared_ptr<ParameterSource>& source,
                          const std::shared_ptr<const describe::Node>& node) {
    if (made_.size() <= place) made_.resize(place + 1);
    auto* parameter = Live<Parameter>(made_[place]);
    if (!parameter || parameter->made_by_ != this || parameter->place_ != place) {    // none yet, or freed since
        parameter = Create<Parameter>(parent, OCI_DTYPE_PARAM, 0, source, this);
        parameter->place_ = place;
        made_[place] = parameter;
    }
    parameter->node_ = node;
    return *parameter;
}

std::shared_ptr<std::recursive_mutex> Parameter::Serial() { return source_ ? source_->Serial() : nullptr; }

std::string_view Parameter::Kept(std::string_view utf8) const {
    std::string converted;
    return source_->KeepText(TextOut(Env(), utf8, converted));
}

Status Parameter::GetMember(std::uint32_t position, void** out) {
    const std::shared_ptr<const describe::Node> list = node_;
    if (!list || position < list->first) return Error(errors::kNoParameter);
    const std::size_t place = position - list->first;
    if (place >= list->members.size()) return Error(errors::kNoParameter);
    if (!out) return Error(errors::kNullArgument);
    *out = &below_.At(place, *Parent(), source_, list->members[place]);
    return {};
}

void* Parameter::GetList() { return node_->list ? &below_.At(0, *Parent(), source_, node_->list) : nullptr; }
