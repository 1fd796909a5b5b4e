// Decimal floats as the server writes them. Command thread only.
#pragma once

#include <cstdint>
#include <string>

// The text of a value: a statement on the default environment, over a service context made from it, so that the log
// shows what the database means. `type` is SQLT_BFLOAT or SQLT_BDOUBLE. Returns the return code of the call that
// failed, or OCI_SUCCESS.
int DecimalFloatText(int type, const unsigned char* data, uint32_t size, std::string& text);
