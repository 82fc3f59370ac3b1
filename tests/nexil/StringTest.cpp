#include <nexil/String.h>

#include <gtest/gtest.h>

namespace {

using Nexil::String;

TEST(String, PartsBehindTheEndAreEmptyAndZeroBytesAreBytes)
{
    String const text("a\0b\xff", 4);
    EXPECT_EQ(text.substr(1, 2), String("\0b", 2));
    EXPECT_EQ(text.substr(3, String::npos).size(), 1u);
    EXPECT_EQ(text.substr(4), "");
    EXPECT_EQ(text.substr(5), "");
    EXPECT_EQ(text.compare(5, 1, ""), 0);
    EXPECT_GT(text.compare(3, 1, "a"), 0) << "as unsigned bytes";
    EXPECT_EQ(text.find("b"), 2u);
    EXPECT_EQ(text.find("b", 3), String::npos);
    EXPECT_EQ(text.rfind("a", 1), 0u);
    EXPECT_NE(text, "a");
    EXPECT_LT(String("a"), text);
    EXPECT_EQ((text + text).size(), 8u);
}

} // namespace
