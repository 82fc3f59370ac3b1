#include <nexil/String.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <random>
#include <vector>

namespace {

using Nexil::String;

TEST(String, SearchesPartsAndOrderAreThoseOfTheBytesZeroOnesIncluded)
{
    std::mt19937 random(1);
    std::vector<std::string> texts;
    for (int i = 0; i < 200; ++i) {
        std::string text(random() % 5, ' ');
        std::ranges::generate(text, [&] { return "\x00\x01z\x7f\x80\xff"[random() % 6]; });
        texts.push_back(i % 2 ? text : text + text);
    }
    for (std::string const& a : texts)
        for (std::string const& b : texts) {
            // Positions around the end and the largest of all.
            std::size_t const position = a.size() + 3 - std::min<std::size_t>(random() % (a.size() + 6), a.size() + 4);
            std::size_t const count = random() % 4 - 1;
            String const x(std::string_view{a});
            String const y(b.data(), b.size());
            auto const part = position <= a.size() ? a.substr(position, count) : std::string();
            ASSERT_EQ(x.find(y, position), a.find(b, position));
            ASSERT_EQ(x.rfind(y, position), a.rfind(b, position));
            ASSERT_EQ(x.substr(position, count).view(), part);
            ASSERT_EQ(x.compare(position, count, y) < 0, part < b);
            ASSERT_EQ(x.compare(position, count, y) == 0, part == b);
            ASSERT_EQ(x < y, a < b); // as unsigned bytes
            ASSERT_EQ(x == y, a == b);
            ASSERT_EQ((x + y).view(), a + b);
        }
    EXPECT_NE(String("a\0b", 3), "a");
}

} // namespace
