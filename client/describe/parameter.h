// Parameter descriptors: what is known of a column of a select list, or of an object that was described. They hang
// below the statement or the describe handle that they came from; their texts stay where they are as long as that lives.
//
// Threads: calls on a parameter hold the serial lock of what it came from.
#pragma once

#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "describe/node.h"
#include "handles/object.h"
#include "handles/status.h"

class Parameter;

// What parameters share with where they came from, which they may outlive.
class ParameterSource {
public:
    virtual ~ParameterSource() = default;
    // What calls hold; null where nothing has to be held.
    [[nodiscard]] virtual std::shared_ptr<std::recursive_mutex> Serial() const = 0;
    // A copy of a text (as the application reads it) that stays where it is as long as the source. Under the lock.
    std::string_view KeepText(std::string_view text);

private:
    std::set<std::string, std::less<>> texts_;
};

// The parameters that came from one thing, by place: each is handed out again, so that asking often leaves nothing
// behind. One that the application has freed is made anew.
class Parameters {
public:
    Parameter& At(std::size_t place, Object& parent, const std::shared_ptr<ParameterSource>& source,
                  const std::shared_ptr<const describe::Node>& node);

private:
    std::vector<Parameter*> made_;
};

class Parameter : public Object {
public:
    static constexpr Kind kKind = Kind::parameter;
    explicit Parameter(const Origin& origin, std::shared_ptr<ParameterSource> source = nullptr,
                       const Parameters* made_by = nullptr)
        : Object(origin), source_(std::move(source)), made_by_(made_by) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;

    [[nodiscard]] const describe::Node& Node() const { return *node_; }
    // The member of a list at a position: 24334 where there is none.
    Status GetMember(std::uint32_t position, void** out);
    // The object's list.
    void* GetList();
    // A text that lives on, as the application reads it.
    [[nodiscard]] std::string_view Kept(std::string_view utf8) const;
    [[nodiscard]] std::string_view KeptBytes(std::string_view bytes) const { return source_->KeepText(bytes); }

private:
    friend class Parameters;
    const std::shared_ptr<ParameterSource> source_;    // null for one that the application allocated
    const Parameters* const made_by_;                  // perhaps gone: compared, never followed
    std::size_t place_ = 0;                            // there
    std::shared_ptr<const describe::Node> node_;       // null as the source
    Parameters below_;                                 // a list's members, or an object's list
};
