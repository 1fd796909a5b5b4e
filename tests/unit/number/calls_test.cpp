// The exported number functions where no command reaches: lists with a hole, texts longer than most, halves of characters.
#include "support/call_fixture.h"

namespace {

struct NumberCalls : CallFixture {
    // A text in the form of the environment.
    std::string Bytes(const std::string& ascii) const {
        std::string bytes;
        for (const char c : ascii) bytes += wide ? std::string{c, '\0'} : std::string{c};
        return bytes;
    }
    sword FromText(const std::string& bytes, const std::string& model, OCINumber* value) {
        return OCINumberFromText(err_, Text(bytes), static_cast<ub4>(bytes.size()), Text(model),
                                 static_cast<ub4>(model.size()), nullptr, 0, value);
    }
    bool wide = false;
};

TEST_F(NumberCalls, ListsLongTextsAndHalves) {
    OCINumber value;
    for (const ub4 mode : {OCI_DEFAULT, OCI_UTF16}) {
        Reopen(mode);
        wide = mode == OCI_UTF16;
        MUST(FromText(Bytes("255"), Bytes("999"), &value));
        const std::string model = Bytes(std::string(300, 'X'));
        std::string shown(1000, '#');
        ub4 size = 1000;
        EXPECT_EQ(OCINumberToText(err_, &value, Text(model), static_cast<ub4>(model.size()), nullptr, 0, &size,
                                  reinterpret_cast<OraText*>(shown.data())), OCI_SUCCESS);
        EXPECT_EQ(shown.substr(0, size), Bytes(std::string(299, ' ') + "FF"));
        EXPECT_EQ(shown[size], '#');
    }
    const std::string half("\x00\xDC", 2);
    EXPECT_EQ(Answer(FromText(half, Bytes("9"), &value)), 24501);
    EXPECT_EQ(Answer(FromText(Bytes("1"), half, &value)), 24501);
    const OCINumber* values[] = {&value, nullptr};
    double reals[2] = {};
    EXPECT_EQ(Answer(OCINumberToRealArray(err_, values, 2, 8, reals)), 21560);
    EXPECT_EQ(reals[0], 255) << "what comes before is converted";
    EXPECT_EQ(Answer(OCINumberToReal(err_, &value, 3, reals)), 21560);
}

}  // namespace
