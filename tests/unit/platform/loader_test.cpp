// Loading the client library: which one, what is said when it or a function is missing, what stands in for it.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "platform/client_library.h"

namespace {

std::string complaints;

class Loader : public testing::Test {
protected:
    Loader() {
        complaints.clear();
        setenv("PROBE_LOG", "/dev/null", 1);
        SetLoaderComplaint([](const char* text) { complaints += text; });
    }
    ~Loader() override {
        for (const char* variable : {"HARNIX_CLIENT_LIBRARY", "HARNIX_TRACE_LOAD", "HARNIX_XA_SWITCH", "PROBE_LOG"})
            unsetenv(variable);
        ForgetClientLibrary();
        SetLoaderComplaint(nullptr);
    }
    static void Use(const char* library) { setenv("HARNIX_CLIENT_LIBRARY", library, 1); }
};

TEST_F(Loader, AMissingLibraryIsToldOnceAndFailsEveryCall) {
    Use("no_such_library.so");
    EXPECT_EQ(complaints, "");
    EXPECT_EQ(Call(&ClientLibrary::OCIPing, nullptr, nullptr, 0), OCI_ERROR);
    EXPECT_EQ(Call(&ClientLibrary::OCIStringPtr, nullptr, nullptr), nullptr);
    EXPECT_EQ(Call(&ClientLibrary::OCIStringSize, nullptr, nullptr), 0u);
    EXPECT_EQ(Call(&ClientLibrary::OCI_memGetMemCount), 0);
    EXPECT_EQ(Call(&ClientLibrary::OCIThreadIsMulti), FALSE);
    Call(&ClientLibrary::OCIThreadProcessInit);
    EXPECT_EQ(Call(&xa_switch_t::xa_close_entry, nullptr, 1, 0), XAER_RMFAIL);
    EXPECT_EQ(complaints, "Could not load client library no_such_library.so: no_such_library.so: cannot open shared "
                          "object file: No such file or directory\n");
}

TEST_F(Loader, AMissingFunctionIsToldAtEachCall) {
    Use(PROBE_PARTIAL_LIBRARY);
    EXPECT_EQ(Call(&ClientLibrary::OCIPing, nullptr, nullptr, 0), OCI_ERROR);
    EXPECT_EQ(Call(&ClientLibrary::OCIPing, nullptr, nullptr, 0), OCI_ERROR);
    EXPECT_EQ(Call(&ClientLibrary::OCIThreadIsMulti), FALSE);
    const std::string once = "Function OCIPing not found in client library\n";
    EXPECT_EQ(complaints, once + once + "Function OCIThreadIsMulti not found in client library\n");
    EXPECT_FALSE(Exports(&ClientLibrary::OCIPing));
    EXPECT_TRUE(Exports(&ClientLibrary::OCIBreak));
}

TEST_F(Loader, OthersStandInForWhatOnlyOursHas) {
    Use(PROBE_PARTIAL_LIBRARY);
    EXPECT_EQ(Call(&ClientLibrary::OCIDateTimeCheckNS, nullptr, nullptr, nullptr, nullptr), OCI_SUCCESS);
    EXPECT_EQ(client_library.OCIDateTimeCheckNS.pointer, client_library.OCIDateTimeCheck.pointer);
    EXPECT_EQ(Call(&ClientLibrary::OCI_memGetMemCount), 0);
    EXPECT_FALSE(Exports(&ClientLibrary::XaGetInfo));
    EXPECT_EQ(client_library.XaGetInfo.missing, Missing::answers_error);
    EXPECT_EQ(complaints, "");
}

TEST_F(Loader, EveryFunctionOfTheInterfaceIsLookedUpUnderItsName) {
    Use(PROBE_LIBRARY);
    LoadClientLibrary();
#define FUNCTION(symbol) EXPECT_NE(client_library.symbol.pointer, nullptr) << client_library.symbol.name;
#include "platform/client_functions.def"
#undef FUNCTION
    EXPECT_NE(client_library.OCIDateTimeCheckNS.pointer, client_library.OCIDateTimeCheck.pointer);
    EXPECT_EQ(complaints, "");
}

TEST_F(Loader, TheSwitchMayHaveAnotherName) {
    Use(PROBE_LIBRARY);
    for (const char* name : {"otherXaSwitch", "emptyXaSwitch"}) {
        ForgetClientLibrary();
        setenv("HARNIX_XA_SWITCH", name, 1);
        EXPECT_EQ(Call(&xa_switch_t::xa_close_entry, nullptr, 1, 0), XAER_RMFAIL) << name;
    }
    EXPECT_EQ(complaints, "Function otherXaSwitch not found in client library\n");
    ForgetClientLibrary();
    unsetenv("HARNIX_XA_SWITCH");
    EXPECT_NE(XaSwitch(), nullptr);
    EXPECT_EQ(Call(&xa_switch_t::xa_close_entry, nullptr, 1, 0), XA_OK);
}

}  // namespace
