#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

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
    const std::map<std::string, std::vector<const char *>> wanted = {
        {"whole",
         {"", "bytes=5-2", "bytes=-", "bytes=", "bytes=2", "bytes=a-b", "bytes=--1", "bytes=1 -2",
          "bytes=0-1,4-5", "bytes 0-1", "seconds=0-1"}},
        {"0-0", {"bytes=0-0"}},
        {"0-9", {"bytes=0-9", "bytes=-99"}},
        {"2-5", {"bytes=2-5", "BYTES=2-5", "bytes= 2-5\t"}},
        {"2-9", {"bytes=2-", "bytes=2-99999999999999999999"}},
        {"7-9", {"bytes=-3"}},
        {"nothing", {"bytes=-0", "bytes=10-", "bytes=10-20", "bytes=99999999999999999999-"}},
    };
    for (const auto &[part, ranges] : wanted) {
        for (const char *range : ranges) {
            EXPECT_EQ(shown(byteRangeOf(range, 10)), part) << range;
        }
    }
    for (const char *range : {"bytes=0-", "bytes=-1"}) {
        EXPECT_EQ(shown(byteRangeOf(range, 0)), "nothing") << range;
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
    EXPECT_THROW(parameters.add("f=1&x=%FF&g=2"), Refusal);
    EXPECT_FALSE(parameters.has("x"));
    EXPECT_EQ(parameters.text("g"), "2") << "what is good is there for the envelope";
}

}  // namespace
}  // namespace webapi
