#include <veldrin/io/InputMemoryBuf.h>

#include <gtest/gtest.h>

#include <istream>

namespace {

/// Opens the protected operations to the test.
class Probe : public Veldrin::IO::InputMemoryBuf {
public:
    using InputMemoryBuf::InputMemoryBuf;
    using InputMemoryBuf::pbackfail;
    using InputMemoryBuf::seekoff;
    using InputMemoryBuf::seekpos;
    using InputMemoryBuf::showmanyc;
    using InputMemoryBuf::uflow;
    using InputMemoryBuf::underflow;
    using InputMemoryBuf::xsgetn;
};

constexpr int kEnd = std::char_traits<char>::eof();

TEST(InputMemoryBuf, ReadsBytesAsUnsignedAndStopsAtTheEnd)
{
    char const bytes[] = {'a', '\xFF'};
    Probe buffer(bytes, 2);
    EXPECT_EQ(buffer.underflow(), 'a');
    EXPECT_EQ(buffer.showmanyc(), 2);
    EXPECT_EQ(buffer.uflow(), 'a');
    EXPECT_EQ(buffer.underflow(), 0xFF);
    EXPECT_EQ(buffer.uflow(), 0xFF);
    EXPECT_EQ(buffer.uflow(), kEnd);
    EXPECT_EQ(buffer.underflow(), kEnd);
    EXPECT_EQ(buffer.showmanyc(), 0);
}

TEST(InputMemoryBuf, StepsBackOnlyOverTheSameCharacter)
{
    char const bytes[] = {'a', '\xF0', 'c'};
    Probe buffer(bytes, 3);
    EXPECT_EQ(buffer.pbackfail('a'), kEnd); // nothing before
    buffer.uflow();
    EXPECT_EQ(buffer.pbackfail('b'), kEnd);
    EXPECT_EQ(buffer.underflow(), 0xF0); // and stayed where it was
    EXPECT_EQ(buffer.pbackfail('a'), 'a');
    EXPECT_EQ(buffer.underflow(), 'a');
    buffer.seekpos(2, std::ios_base::in);
    EXPECT_EQ(buffer.pbackfail(0xF0), kEnd); // the byte counts as a signed character
    EXPECT_EQ(buffer.pbackfail(static_cast<signed char>('\xF0')), 0xF0);
    buffer.uflow();
    EXPECT_EQ(buffer.pbackfail(kEnd), 0xF0); // end-of-file: whatever stands there
}

TEST(InputMemoryBuf, SeeksWithinTheBlockAlone)
{
    char const bytes[] = "0123456789";
    struct Case {
        std::streamoff offset;
        std::ios_base::seekdir direction;
        std::streamoff expected;
    };
    constexpr auto kFar = std::numeric_limits<std::streamoff>::max();
    constexpr auto kNear = std::numeric_limits<std::streamoff>::min();
    for (Case const& test : {Case{0, std::ios_base::beg, 0},
                             {10, std::ios_base::beg, 10},
                             {11, std::ios_base::beg, -1},
                             {-1, std::ios_base::beg, -1},
                             {0, std::ios_base::cur, 4},
                             {6, std::ios_base::cur, 10},
                             {7, std::ios_base::cur, -1},
                             {-4, std::ios_base::cur, 0},
                             {-5, std::ios_base::cur, -1},
                             {0, std::ios_base::end, 10},
                             {1, std::ios_base::end, -1},
                             {-10, std::ios_base::end, 0},
                             {-11, std::ios_base::end, -1},
                             {kFar, std::ios_base::cur, -1},
                             {kNear, std::ios_base::end, -1},
                             {0, static_cast<std::ios_base::seekdir>(7), -1}}) {
        Probe buffer(bytes, 10);
        buffer.seekpos(4, std::ios_base::in);
        auto const found = std::streamoff(buffer.seekoff(test.offset, test.direction, std::ios_base::out));
        EXPECT_EQ(found, test.expected) << test.offset << " from " << test.direction;
        EXPECT_EQ(buffer.showmanyc(), 10 - (test.expected < 0 ? 4 : test.expected));
    }
}

TEST(InputMemoryBuf, AnEmptyBlockIsAtItsEnd)
{
    Probe buffer(nullptr, 0);
    EXPECT_EQ(buffer.underflow(), kEnd);
    EXPECT_EQ(buffer.uflow(), kEnd);
    EXPECT_EQ(buffer.showmanyc(), 0);
    EXPECT_EQ(std::streamoff(buffer.seekoff(0, std::ios_base::end, std::ios_base::in)), 0);
    EXPECT_EQ(std::streamoff(buffer.seekoff(1, std::ios_base::end, std::ios_base::in)), -1);
    char byte = 'x';
    EXPECT_EQ(buffer.xsgetn(&byte, 1), 0);
}

TEST(InputMemoryBuf, ServesAStandardStream)
{
    std::string const text = "one 2 three";
    Veldrin::IO::InputMemoryBuf buffer(text.data(), text.size());
    std::istream stream(&buffer);
    std::string word;
    int number = 0;
    stream >> word >> number;
    EXPECT_EQ(word, "one");
    EXPECT_EQ(number, 2);
    char rest[16];
    stream.read(rest, sizeof(rest));
    EXPECT_EQ(stream.gcount(), 6);
}

} // namespace
