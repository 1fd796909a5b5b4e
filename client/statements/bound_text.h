// The text of a statement with what is bound to its placeholders. A placeholder whose bind handle is freed counts as
// one that nothing is bound to.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "handles/status.h"
#include "oci.h"
#include "sql/statement_text.h"
#include "statements/bind.h"

class Environment;

// What OCIStmtGetBindInfo asks for.
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

class BoundText {
public:
    // Scans a new text, to which nothing is bound. The former one's handles must have been let go (Release), its
    // placeholders are not looked at.
    void Take(std::string&& text, sql::StatementText&& scanned, std::vector<std::shared_ptr<BindArea>>&& places) noexcept;
    [[nodiscard]] bool IsSet() const { return is_set_; }
    [[nodiscard]] const std::string& Text() const { return text_; }
    [[nodiscard]] const sql::StatementText& Scanned() const { return scanned_; }
    [[nodiscard]] std::size_t Count() const { return bound_.size(); }

    // What is bound to a placeholder, or null.
    [[nodiscard]] const std::shared_ptr<BindArea>& At(std::size_t placeholder) const { return bound_[placeholder]; }
    [[nodiscard]] bool IsBound(std::size_t placeholder) const {
        return bound_[placeholder] && bound_[placeholder]->HasHandle();
    }
    // Goes up with each change of what is bound.
    [[nodiscard]] std::uint32_t Changes() const { return changes_; }
    [[nodiscard]] bool AnyInPieces() const;

    // The first placeholder of a name as a bind call writes it, or of a position; null when there is none.
    [[nodiscard]] const std::uint32_t* FindName(std::string_view written) const;
    [[nodiscard]] const std::uint32_t* FindPosition(ub4 position) const;
    // Binds one placeholder, or every one of the same name. What was bound there goes when nothing else has it.
    void Bind(std::uint32_t placeholder, bool all_of_name, const std::shared_ptr<BindArea>& area, const Object& statement);
    // Lets all binds go.
    void Release(const Object& statement) noexcept;

    Status Describe(const BindInfo& info, const Environment& environment);

    std::shared_ptr<values::LobSession> lobs;    // of the session that the statement runs in

private:
    void Put(std::size_t placeholder, const std::shared_ptr<BindArea>& area, const Object& statement);
    const std::string& KeptName(std::size_t placeholder, bool indicator, const Environment& environment);

    std::string text_;
    sql::StatementText scanned_;
    bool is_set_ = false;
    std::vector<std::shared_ptr<BindArea>> bound_;    // by placeholder
    std::uint32_t changes_ = 0;
    std::vector<std::string> kept_names_;             // in UTF-16
};
