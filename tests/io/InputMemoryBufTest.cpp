#include <veldrin/io/InputMemoryBuf.h>

#include <gtest/gtest.h>

#include <limits>
#include <random>
#include <sstream>

namespace {

using Veldrin::IO::InputMemoryBuf;

constexpr std::ios_base::seekdir kDirections[] = {std::ios_base::beg, std::ios_base::cur, std::ios_base::end};

TEST(InputMemoryBuf, AnswersAsTheStandardBufferOfTheSameBytes)
{
    std::mt19937 random(1);
    for (std::string const& text : {std::string(), std::string("a\xFF"), std::string("0123\0\xF0\x7F 89", 10)}) {
        InputMemoryBuf buffer(text.data(), text.size());
        std::stringbuf model(text, std::ios_base::in);
        for (int step = 0; step < 3000; ++step) {
            auto const expectSame = [&](auto const& ask) { ASSERT_EQ(ask(buffer), ask(model)) << text << step; };
            auto const offset = static_cast<int>(random() % 24) - 12;
            auto const direction = kDirections[random() % 3];
            // Bytes from 0x80 on are another matter: see below.
            char const character = text.empty() ? 'x' : static_cast<char>(text[random() % text.size()] & 0x7F);
            expectSame([](std::streambuf& b) { return b.in_avail(); });
            expectSame([](std::streambuf& b) { return b.sgetc(); });
            switch (random() % 5) {
            case 0: expectSame([](std::streambuf& b) { return b.sbumpc(); }); break;
            case 1: expectSame([](std::streambuf& b) { return b.sungetc(); }); break;
            case 2: expectSame([&](std::streambuf& b) { return b.sputbackc(character); }); break;
            case 3:
                expectSame([&](std::streambuf& b) {
                    return std::streamoff(b.pubseekoff(offset, direction, std::ios_base::in));
                });
                break;
            default:
                expectSame([&](std::streambuf& b) {
                    std::string got(12, '.');
                    got.resize(static_cast<std::size_t>(b.sgetn(got.data(), offset + 12)) % 13);
                    return got;
                });
            }
        }
    }
}

TEST(InputMemoryBuf, RefusesFarSeeksAndTakesHighBytesAsSignedCharacters)
{
    struct Probe : InputMemoryBuf {
        using InputMemoryBuf::InputMemoryBuf;
        using InputMemoryBuf::pbackfail;
    } buffer("a\xF0", 2);
    EXPECT_EQ(std::streamoff(buffer.pubseekpos(2)), 2);
    for (auto const direction : kDirections)
        for (auto const offset :
             {std::numeric_limits<std::streamoff>::max(), std::numeric_limits<std::streamoff>::min()})
            EXPECT_EQ(std::streamoff(buffer.pubseekoff(offset, direction)), -1);
    EXPECT_EQ(buffer.pbackfail(0xF0), std::char_traits<char>::eof());
    EXPECT_EQ(buffer.pbackfail(static_cast<signed char>('\xF0')), 0xF0);
}

} // namespace
