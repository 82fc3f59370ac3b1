#include <nexil/String.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <random>
#include <vector>

namespace {

using Nexil::String;

TEST(String, SearchesAndPartsKeepToTheBytesThereAre)
{
    constexpr auto npos = String::npos;
    String const text("abcabc");
    struct {
        char const* wanted;
        std::size_t position, first, last;
    } const searches[] = {{"bc", 1, 1, 1}, {"bc", 2, 4, 1},  {"bc", 5, npos, 4},        {"bc", npos, npos, 4},
                          {"", 6, 6, 6},   {"", 7, npos, 6}, {"abcabcd", 0, npos, npos}};
    for (auto const& row : searches) {
        EXPECT_EQ(text.find(row.wanted, row.position), row.first) << row.wanted << row.position;
        EXPECT_EQ(text.rfind(row.wanted, row.position), row.last) << row.wanted << row.position;
    }
    struct {
        std::size_t position, count;
        char const* part;
    } const parts[] = {{0, 3, "abc"}, {4, npos, "bc"}, {6, 1, ""}, {7, 1, ""}, {npos, npos, ""}, {2, 0, ""}};
    for (auto const& row : parts) {
        EXPECT_EQ(text.substr(row.position, row.count), row.part) << row.position;
        EXPECT_EQ(text.compare(row.position, row.count, row.part), 0) << row.position;
        EXPECT_LT(text.compare(row.position, row.count, String(row.part) + "\x80"), 0) << row.position;
    }
}

TEST(String, ZeroBytesAreBytesAndTheOrderIsThatOfUnsignedOnes)
{
    std::mt19937 random(1);
    std::vector<String> texts;
    for (int i = 0; i < 200; ++i) {
        std::string text(random() % 4, ' ');
        std::ranges::generate(text, [&] { return "\x00\x01z\x7f\x80\xff"[random() % 6]; });
        texts.emplace_back(text.data(), text.size());
        EXPECT_EQ(texts.back().size(), text.size());
        EXPECT_EQ(texts.back().find(String("\0", 1)), text.find('\0'));
    }
    auto const lower = [](char x, char y) { return static_cast<unsigned char>(x) < static_cast<unsigned char>(y); };
    for (String const& a : texts)
        for (String const& b : texts) {
            ASSERT_EQ(a < b, std::ranges::lexicographical_compare(a.view(), b.view(), lower));
            ASSERT_EQ(a.compare(0, String::npos, b) < 0, a < b);
            ASSERT_EQ(a == b, std::ranges::equal(a.view(), b.view()));
            ASSERT_EQ((a + b).substr(a.size()), b);
        }
    EXPECT_NE(String("a\0b", 3), "a");
}

TEST(String, IsAssignedFromPartsOfItselfAndFromNothing)
{
    String text("a text that is long enough for a block of its own");
    text.assign(text.c_str() + 2, 4);
    EXPECT_EQ(text, "text");
    text += text;
    EXPECT_EQ(text, "texttext");
    text = {};
    EXPECT_EQ(text, "");
}

} // namespace
