// The texts of logons as the application gives them: names, passwords, databases. For all calls that begin a session.
#pragma once

#include <string>

#include "engine/engine.h"
#include "entry/call_text.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "handles/status.h"
#include "oci.h"

inline Status ReadText(const Environment& environment, const OraText* text, ub4 length, std::string& utf8) {
    const CallText in(environment, text, length, false);
    if (!in.Valid()) return Error(errors::kBadText);
    utf8 = in.View();
    return {};
}

inline Status ReadDatabase(const Environment& environment, const OraText* text, ub4 length, std::string& database) {
    if (!text && length != 0) return Error(errors::kLengthWithoutText);
    return ReadText(environment, text, length, database);
}

// Without a name and a password it is the operating-system user.
inline Status CheckCredentials(engine::Credentials& credentials) {
    credentials.external = credentials.user.empty() && credentials.password.empty();
    if (credentials.external) return {};
    if (credentials.user.empty()) return Error(errors::kBadLogon);
    return credentials.password.empty() ? Error(errors::kNoPassword) : Status();
}

inline Status ReadCredentials(const Environment& environment, const OraText* user, ub4 user_length,
                              const OraText* password, ub4 password_length, engine::Credentials& credentials) {
    Status status = ReadText(environment, user, user_length, credentials.user);
    if (status.Ok()) status = ReadText(environment, password, password_length, credentials.password);
    return status.Ok() ? CheckCredentials(credentials) : status;
}
