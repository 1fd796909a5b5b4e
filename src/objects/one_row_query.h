// A query of the driver's own that turns one value into another: one placeholder, one column, one row. It runs on the
// default environment, over a service context made from it. Command thread only.
#pragma once

#include "oci.h"

class OneRowQuery {
public:
    OneRowQuery();
    ~OneRowQuery();  // frees the statement
    OneRowQuery(const OneRowQuery&) = delete;
    OneRowQuery& operator=(const OneRowQuery&) = delete;

    // Each does nothing after one that failed. What is bound and defined must live until the query has run.
    void Prepare(const char* sql);
    void Bind(void* value, sb4 size, ub2 type);
    void Define(void* value, sb4 size, ub2 type, sb2* indicator = nullptr, ub2* length = nullptr,
                ub2* code = nullptr);
    // The return code of what failed, else that of the execution.
    sword Execute();

private:
    OCIStmt* statement_ = nullptr;
    sword rc_;
};
