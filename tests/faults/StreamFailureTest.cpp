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

    [[nodiscard]] bool hasFailed() const { return untilFailure_ == 0; }

protected:
    std::streamsize xsgetn(char* target, std::streamsize count) override
    {
        return std::stringbuf::xsgetn(target, allowed(count));
    }
    std::streamsize xsputn(char const* source, std::streamsize count) override
    {
        return std::stringbuf::xsputn(source, allowed(count));
    }
    pos_type seekoff(off_type offset, std::ios_base::seekdir direction, std::ios_base::openmode which) override
    {
        return allowed(1) ? std::stringbuf::seekoff(offset, direction, which) : pos_type(off_type(-1));
    }
    pos_type seekpos(pos_type position, std::ios_base::openmode which) override
    {
        return allowed(1) ? std::stringbuf::seekpos(position, which) : pos_type(off_type(-1));
    }
    int sync() override { return allowed(1) ? std::stringbuf::sync() : -1; }

private:
    /// How much of `count` the next operation does.
    std::streamsize allowed(std::streamsize count)
    {
        if (untilFailure_ == 0 || --untilFailure_ > 0)
            return count;
        if (fault_ == Fault::Throws)
            throw std::runtime_error("broken device");
        return fault_ == Fault::IsShort ? count / 2 : 0;
    }

    std::uint64_t untilFailure_;
    Fault fault_;
};

/// Calls attempt(buffer, messages), which answers whether it succeeded, with each operation going wrong in turn until none
/// does, and answers how many of them it succeeded in spite of. Failures have one message each.
template <class Attempt>
int failEachOperation(std::string const& bytes, Attempt const& attempt)
{
    int survived = 0;
    for (auto const fault : {Fault::Fails, Fault::IsShort, Fault::Throws})
        for (std::uint64_t number = 1;; ++number) {
            FailingBuf buffer(bytes, number, fault);
            support::Messages messages;
            bool const isDone = attempt(buffer, messages);
            EXPECT_EQ(messages.errors().size(), isDone ? 0u : 1u);
            if (!buffer.hasFailed()) {
                EXPECT_TRUE(isDone && number > 2) << "without a fault";
                break;
            }
            survived += isDone;
        }
    return survived;
}

Objects objectsOf(Sample const& sample)
{
    Objects objects;
    for (auto const& object : {sample.geometry, sample.smallVolume, sample.geometry})
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
        failEachOperation(stream, [&](FailingBuf& buffer, Messages& messages) {
            std::istream bytes(&buffer);
            Nexil::InputStream input(bytes);
            Objects objects;
            bool const isRead = IO::deserialize(input, objects, {}, &messages);
            EXPECT_EQ(objects.size(), isRead ? whole.objects.size() : 0u);
            // A stream that refuses to seek may still be read from front to back.
            for (std::uint64_t i = 0; i < objects.size(); ++i)
                EXPECT_TRUE(objects[i] ? support::dump(*objects[i]) == support::dump(*whole.objects[i])
                                       : !whole.objects[i]);
            return isRead;
        });
        failEachOperation(stream, [&](FailingBuf& buffer, Messages& messages) {
            std::istream bytes(&buffer);
            Nexil::InputStream input(bytes);
            return IO::deserializeHeader(input, *createObject(), &messages);
        });
    }
}

TEST(StreamFailure, AtAnyWriteSeekOrFlushIsAFailureWithOneMessage)
{
    auto const objects = objectsOf(Sample());
    for (int const level : {0, 9}) {
        int const survived = failEachOperation("", [&](FailingBuf& buffer, Messages& messages) {
            std::ostream bytes(&buffer);
            Nexil::OutputStream output(bytes);
            IO::SerializationOptions options;
            options.compressionLevel = level;
            return IO::serialize(objects, output, options, &messages);
        });
        EXPECT_EQ(survived, 0);
    }
}

} // namespace
