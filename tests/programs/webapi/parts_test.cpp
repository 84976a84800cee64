#include <gtest/gtest.h>

#include <string>

#include "byte_range.h"
#include "parameters.h"
#include "refusal.h"

namespace webapi {
namespace {

std::string shown(const ByteRange &range) {
    switch (range.wanted) {
        case Wanted::kWhole:
            return "whole";
        case Wanted::kNothing:
            return "nothing";
        case Wanted::kPart:
            return std::to_string(range.first) + "-" + std::to_string(range.last);
    }
    return "";
}

TEST(ByteRanges, AsTheHeaderNamesThem) {
    const struct {
        const char *range;
        int size;
        const char *wanted;
    } cases[] = {
        {"", 10, "whole"},
        {"bytes=0-0", 10, "0-0"},
        {"bytes=0-9", 10, "0-9"},
        {"bytes=2-5", 10, "2-5"},
        {"BYTES=2-5", 10, "2-5"},
        {"bytes= 2-5\t", 10, "2-5"},
        {"bytes=2-", 10, "2-9"},
        {"bytes=2-99999999999999999999", 10, "2-9"},
        {"bytes=-3", 10, "7-9"},
        {"bytes=-99", 10, "0-9"},
        {"bytes=-0", 10, "nothing"},
        {"bytes=10-", 10, "nothing"},
        {"bytes=10-20", 10, "nothing"},
        {"bytes=99999999999999999999-", 10, "nothing"},
        {"bytes=0-", 0, "nothing"},
        {"bytes=-1", 0, "nothing"},
        {"bytes=5-2", 10, "whole"},
        {"bytes=-", 10, "whole"},
        {"bytes=", 10, "whole"},
        {"bytes=2", 10, "whole"},
        {"bytes=a-b", 10, "whole"},
        {"bytes=--1", 10, "whole"},
        {"bytes=1 -2", 10, "whole"},
        {"bytes=0-1,4-5", 10, "whole"},
        {"bytes 0-1", 10, "whole"},
        {"seconds=0-1", 10, "whole"},
    };
    for (const auto &row : cases) {
        EXPECT_EQ(shown(byteRangeOf(row.range, row.size)), row.wanted) << row.range;
    }
}

TEST(ParametersOfARequest, AreDecoded) {
    Parameters parameters;
    parameters.add("a=1&b=two+words%21&&c&a=%C3%A9&%64=%2&e=%zz=");
    EXPECT_EQ(parameters.text("a"), "é");
    EXPECT_EQ(parameters.text("b"), "two words!");
    EXPECT_TRUE(parameters.has("c"));
    EXPECT_EQ(parameters.text("d"), "%2");
    EXPECT_EQ(parameters.text("e"), "%zz=");
    EXPECT_FALSE(parameters.has(""));
    for (const char *bad : {"x=%FF", "x=a%00", "x=%ED%A0%80", "x=%C3"}) {
        EXPECT_THROW(parameters.add(std::string("f=1&") + bad + "&g=2"), Refusal) << bad;
        EXPECT_FALSE(parameters.has("x"));
    }
    EXPECT_EQ(parameters.text("g"), "2") << "what is good is there for the envelope";
}

}  // namespace
}  // namespace webapi
