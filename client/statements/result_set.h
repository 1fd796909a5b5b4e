// Result-set descriptors: what `open :c for` fills. A statement in all but name, which OCIResultSetToStmt gives it.
#pragma once

#include "statements/statement.h"

class ResultSet final : public Statement {
public:
    static constexpr Kind kKind = Kind::result_set;
    explicit ResultSet(const Origin& origin) : Statement(origin) {}

    // From now on the same pointer is a statement handle.
    void BecomeStatement();
};
