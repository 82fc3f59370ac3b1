#include "Operations.h"

#include <support/Geometry.h>
#include <support/Streams.h>

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using support::Messages;
using support::Objects;
using support::Sample;
using namespace Veldrin;

enum class Fault { Fails, IsShort, Throws };

/// A stream of bytes in memory, of whose operations one goes wrong.
class FailingBuf : public std::stringbuf {
public:
    FailingBuf(std::string const& bytes, std::uint64_t number, Fault fault)
        : std::stringbuf(bytes, std::ios::in | std::ios::out | std::ios::binary), untilFailure_(number), fault_(fault)
    {
    }

    [[nodiscard]] bool hasFailed() const { return hasFailed_; }

protected:
    int_type underflow() override { return failsNow() ? traits_type::eof() : std::stringbuf::underflow(); }
    int_type uflow() override { return failsNow() ? traits_type::eof() : std::stringbuf::uflow(); }
    int_type overflow(int_type c) override { return failsNow() ? traits_type::eof() : std::stringbuf::overflow(c); }
    std::streamsize xsgetn(char* target, std::streamsize count) override
    {
        return std::stringbuf::xsgetn(target, failsNow() ? shortened(count) : count);
    }
    std::streamsize xsputn(char const* source, std::streamsize count) override
    {
        return std::stringbuf::xsputn(source, failsNow() ? shortened(count) : count);
    }
    pos_type seekoff(off_type offset, std::ios_base::seekdir direction, std::ios_base::openmode which) override
    {
        return failsNow() ? pos_type(off_type(-1)) : std::stringbuf::seekoff(offset, direction, which);
    }
    pos_type seekpos(pos_type position, std::ios_base::openmode which) override
    {
        return failsNow() ? pos_type(off_type(-1)) : std::stringbuf::seekpos(position, which);
    }
    int sync() override { return failsNow() ? -1 : std::stringbuf::sync(); }

private:
    bool failsNow()
    {
        if (untilFailure_ == 0 || --untilFailure_ > 0)
            return false;
        hasFailed_ = true;
        if (fault_ == Fault::Throws)
            throw std::runtime_error("broken device");
        return true;
    }

    [[nodiscard]] std::streamsize shortened(std::streamsize count) const
    {
        return fault_ == Fault::IsShort ? count / 2 : 0;
    }

    std::uint64_t untilFailure_;
    Fault fault_;
    bool hasFailed_ = false;
};

/// Calls attempt(buffer), which answers whether it succeeded, with each operation going wrong in turn until none does, and
/// answers how many of them it succeeded in spite of.
template <class Attempt>
int failEachOperation(std::string const& bytes, Attempt const& attempt)
{
    int survived = 0;
    for (auto const fault : {Fault::Fails, Fault::IsShort, Fault::Throws}) {
        int failed = 0;
        for (std::uint64_t number = 1;; ++number) {
            FailingBuf buffer(bytes, number, fault);
            bool const isDone = attempt(buffer);
            if (!buffer.hasFailed()) {
                EXPECT_TRUE(isDone) << "without a fault";
                break;
            }
            ++(isDone ? survived : failed);
        }
        EXPECT_GT(failed, 1);
    }
    return survived;
}

Objects objectsOf(Sample const& sample)
{
    Objects objects;
    for (auto const& object : {sample.mesh, sample.strands, sample.smallVolume, sample.mesh})
        objects.push_back(object);
    // Arrays so long that they are read past the window, by seeking.
    objects.push_back(support::filled([](Object& o) { Geometry::populatePlaneMesh(1, 70, o); }));
    return objects;
}

TEST(StreamFailure, AtAnyReadOrSeekGivesOneMessageAndNoObject)
{
    Sample const sample;
    std::string const corpus = VELDRIN_TEST_CORPUS "/streams/valid/";
    for (auto const& stream :
         {support::written(objectsOf(sample), 0), support::written(objectsOf(sample), 9),
          support::fileBytes(corpus + "v1.zon"), support::fileBytes(corpus + "v3.zon"),
          support::fileBytes(corpus + "v4_handles.zon"), support::fileBytes(corpus + "v5_handles.zon")}) {
        auto const whole = support::read(stream);
        failEachOperation(stream, [&](FailingBuf& buffer) {
            std::istream bytes(&buffer);
            Nexil::InputStream input(bytes);
            Messages messages;
            Objects objects;
            bool const isRead = IO::deserialize(input, objects, {}, &messages);
            EXPECT_EQ(messages.errors().size(), isRead ? 0u : 1u);
            EXPECT_EQ(objects.size(), isRead ? whole.objects.size() : 0u);
            // A stream that refuses to seek may still be read from front to back.
            for (std::uint64_t i = 0; i < objects.size(); ++i)
                EXPECT_TRUE(objects[i] ? support::dump(*objects[i]) == support::dump(*whole.objects[i])
                                       : !whole.objects[i]);
            return isRead;
        });
        failEachOperation(stream, [&](FailingBuf& buffer) {
            std::istream bytes(&buffer);
            Nexil::InputStream input(bytes);
            Messages messages;
            auto const header = createObject();
            bool const isRead = IO::deserializeHeader(input, *header, &messages);
            EXPECT_EQ(messages.errors().size(), isRead ? 0u : 1u);
            return isRead;
        });
    }
}

TEST(StreamFailure, AtAnyWriteSeekOrFlushIsAFailureWithOneMessage)
{
    Sample const sample;
    auto const before = sample.description();
    auto const objects = objectsOf(sample);
    for (int const level : {0, 9}) {
        int const survived = failEachOperation("", [&](FailingBuf& buffer) {
            std::ostream bytes(&buffer);
            Nexil::OutputStream output(bytes);
            Messages messages;
            IO::SerializationOptions options;
            options.compressionLevel = level;
            bool const isWritten = IO::serialize(objects, output, options, &messages);
            EXPECT_EQ(messages.errors().size(), isWritten ? 0u : 1u);
            return isWritten;
        });
        EXPECT_EQ(survived, 0);
    }
    EXPECT_EQ(sample.description(), before);
}

TEST(StreamFailure, OfAStreamWithoutABufferIsAMessage)
{
    std::iostream nowhere(nullptr);
    Nexil::InputStream input(nowhere);
    Nexil::OutputStream output(nowhere);
    Messages messages;
    Objects objects;
    auto const header = createObject();
    EXPECT_FALSE(IO::deserialize(input, objects, {}, &messages));
    EXPECT_FALSE(IO::deserializeHeader(input, *header, &messages));
    EXPECT_FALSE(IO::serialize(objects, output, {}, &messages));
    EXPECT_EQ(messages.errors().size(), 3u);
}

} // namespace
