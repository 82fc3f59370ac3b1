#include <support/Environment.h>
#include <support/Geometry.h>
#include <support/Streams.h>

#include <nexil/JobCancel.h>
#include <veldrin/io/StreamKeys.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

using testing::ElementsAre;
using Veldrin::createObject;
using Veldrin::getPropertyAs;
using Veldrin::setProperty;
using ObjectPtr = Nexil::Ptr<Veldrin::Object>;
using Bytes = Nexil::Ptr<Nexil::Array<unsigned char>>;

Nexil::MutablePtr<Veldrin::Object> objectWith(char const* key, Nexil::Any value)
{
    auto object = createObject();
    object->setPropertyAny(key, std::move(value));
    return object;
}

/// A list of one object of one property.
support::Objects listOf(char const* key, Nexil::Any value)
{
    return {objectWith(key, std::move(value))};
}

ObjectPtr readOne(std::string const& bytes)
{
    auto const result = support::read(bytes);
    EXPECT_TRUE(result.isRead) << testing::PrintToString(result.errors);
    return result.objects.size() == 1 ? result.objects[0] : ObjectPtr();
}

/// What is said when the objects are refused.
std::vector<std::string> refusal(support::Objects const& objects, int level = 0)
{
    support::Messages messages;
    EXPECT_EQ(support::written(objects, level, &messages), "");
    return messages.errors();
}

TEST(StreamRoundTrip, LongArraysComeBackThroughTheWindowAndBesideIt)
{
    // Sizes around the point from which on bytes go straight from the stream into the array, and one that is hashed beside.
    for (std::uint64_t const size : {65535u, 65536u, 65537u, 300000u, 3000000u})
        for (int const level : {0, 9}) {
            std::vector<unsigned char> bytes(size);
            for (std::uint64_t i = 0; i < size; ++i)
                bytes[i] = static_cast<unsigned char>(i * 2654435761u >> 13); // hardly to be compressed
            auto object = objectWith("first", support::array(bytes));
            setProperty(*object, "between", 7);
            setProperty(*object, "second", support::array(bytes));
            support::Objects const objects{ObjectPtr(std::move(object))};
            std::string stream = support::written(objects, level);
            auto const back = readOne(stream);
            EXPECT_EQ(back->keys().size(), 3u);
            for (char const* key : {"first", "second"})
                EXPECT_TRUE(*getPropertyAs<Bytes>(*back, key) == *support::array(bytes)) << key;
            stream[stream.size() / 2] = static_cast<char>(stream[stream.size() / 2] ^ 4);
            EXPECT_THAT(support::read(stream).errors, ElementsAre("Checksum mismatch"));
        }
}

TEST(StreamRoundTrip, AChainOfAHundredThousandObjectsNeedsNoStack)
{
    ObjectPtr chain = objectWith("end", true);
    for (int i = 0; i < 100000; ++i)
        chain = objectWith("next", std::move(chain));
    ObjectPtr back = readOne(support::written({chain}, 1));
    int length = 0;
    for (; back && back->hasProperty("next"); ++length)
        back = getPropertyAs<ObjectPtr>(*back, "next");
    EXPECT_EQ(length, 100000);
    EXPECT_TRUE(back && getPropertyAs<bool>(*back, "end"));
}

TEST(StreamRoundTrip, SharedAndTwinValuesComeBackOnceAndAreHeldByNothingElse)
{
    auto const data = support::array<float>({1, 2, 3});
    ObjectPtr const part = objectWith("data", data);
    auto whole = objectWith("part", part);
    setProperty(*whole, "data", data);
    setProperty(*whole, "own", support::array<unsigned long>({4}));
    setProperty(*whole, "number", -5l);
    auto once = support::array<int>({7});
    setProperty(*whole, "any", support::array<Nexil::Any>({once}));
    setProperty(*whole, "once", std::move(once));
    auto const back = support::read(support::written({ObjectPtr(std::move(whole)), part})).objects;
    ASSERT_EQ(back.size(), 2u);
    EXPECT_EQ(back[1], getPropertyAs<ObjectPtr>(*back[0], "part"));
    EXPECT_EQ(back[1].useCount(), 2u);
    EXPECT_EQ(getPropertyAs<Nexil::Ptr<Nexil::Array<float>>>(*back[0], "data").useCount(), 3u);
    EXPECT_EQ(getPropertyAs<Nexil::Ptr<Nexil::Array<unsigned long long>>>(*back[0], "own").useCount(), 2u);
    EXPECT_EQ(getPropertyAs<long long>(*back[0], "number"), -5);
    using Ints = Nexil::Ptr<Nexil::Array<int>>;
    auto const any = getPropertyAs<Nexil::Ptr<Nexil::Array<Nexil::Any>>>(*back[0], "any");
    EXPECT_EQ(*(*any)[0].get<Ints>(), getPropertyAs<Ints>(*back[0], "once"));
}

TEST(StreamRoundTrip, UnknownTypesAreLeftOutWithAWarning)
{
    struct Secret {};
    auto object = objectWith("before", 1);
    setProperty(*object, "hidden", Secret{});
    object->setPropertyAny("nothing", {});
    support::Messages messages;
    auto const back = readOne(support::written({ObjectPtr(std::move(object))}, 9, &messages));
    EXPECT_EQ(back->keys(), (Nexil::Array<Nexil::String>{"before", "nothing"}));
    EXPECT_TRUE(back->getProperty("nothing").empty());
    EXPECT_THAT(messages.texts(Nexil::RuntimeMessageCategory::Warning),
                ElementsAre(testing::AllOf(testing::StartsWith("Property 'hidden' is of the unknown type: '"),
                                           testing::EndsWith("Secret'. it will not be serialized."))));
}

TEST(StreamRoundTrip, HandlesComeBackAsObjectsFromWhereTheStreamStands)
{
    ObjectPtr first = objectWith("n", 1);
    ObjectPtr second = first;
    ObjectPtr null;
    std::stringstream stream;
    stream << "something else";
    Nexil::OutputStream output(stream);
    ASSERT_TRUE(Veldrin::IO::serialize(Nexil::Array<ObjectPtr*>{&first, &null, &second, &first}, output, {}, nullptr));
    EXPECT_NE(stream.str().find("serialize_handle_addresses"), std::string::npos);
    stream.seekg(14);
    Nexil::InputStream input(stream);
    support::Objects back{null};
    ASSERT_TRUE(Veldrin::IO::deserialize(input, back, {}, nullptr));
    ASSERT_EQ(back.size(), 5u);
    EXPECT_EQ(getPropertyAs<int>(*back[1], "n"), 1);
    EXPECT_EQ(back[1], back[3]);
    EXPECT_FALSE(back[2]);
    EXPECT_EQ(stream.tellg(), std::streampos(stream.str().size()));
}

TEST(StreamRoundTrip, AStreamThatCannotSeekIsReadFromFrontToBack)
{
    struct Pipe : std::stringbuf {
        using std::stringbuf::stringbuf;
        pos_type seekoff(off_type, std::ios_base::seekdir, std::ios_base::openmode) override { return off_type(-1); }
        pos_type seekpos(pos_type, std::ios_base::openmode) override { return off_type(-1); }
    };
    support::Objects const objects = listOf("values", support::array<float>({1, 2}));
    Pipe pipe(support::written(objects));
    std::istream stream(&pipe);
    Nexil::InputStream input(stream);
    support::Objects back;
    ASSERT_TRUE(Veldrin::IO::deserialize(input, back, {}, nullptr));
    EXPECT_EQ(support::contentOf(back), support::contentOf(objects));
}

TEST(StreamRoundTrip, WhatCouldNotBeReadAgainIsNotWritten)
{
    struct Secret {};
    EXPECT_THAT(refusal(listOf("mixed", support::array<Nexil::Any>({Secret{}}))),
                ElementsAre("Unserializable type found in an Any!"));
    EXPECT_THAT(refusal(listOf("mode", Veldrin::Geometry::Common::DataInterpolationMode(7))),
                ElementsAre("Integral type overflow"));
    EXPECT_THAT(refusal(listOf("v", Veldrin::Math::float3{1, 2, 3}), 10), ElementsAre("compression error"));

    ObjectPtr const inner = objectWith("n", 1);
    support::Objects const outer = listOf("inner", inner);
    // No public way leads to a cycle; a host with its own object classes can still hand one in.
    const_cast<Veldrin::Object&>(*inner).setPropertyAny("outer", outer[0]);
    EXPECT_THAT(refusal(outer), ElementsAre("Bad parent"));
    const_cast<Veldrin::Object&>(*inner).eraseProperty("outer");

    // Memory that is never touched, in more chunks than a file can count.
    Nexil::Array<unsigned char> bytes;
    Nexil::Internal::resizeUninitialized(bytes, (std::uint64_t(1) << 32) + 1);
    support::Objects const large = listOf("bytes", Nexil::makePtr<Nexil::Array<unsigned char>>(std::move(bytes)));
    support::EnvironmentVariable const variable("VELDRIN_MAX_SERIALIZATION_ARRAY_SIZE", "1");
    EXPECT_THAT(refusal(large, 0), ElementsAre("Array too large to serialize"));
    EXPECT_THAT(refusal(large, 1), ElementsAre("chunk limit exceeded"));
}

TEST(StreamHeader, IsReadAloneAndNothingBehindIt)
{
    std::stringstream stream(support::written(listOf("n", 1), 3) + "behind");
    Nexil::InputStream input(stream);
    Veldrin::Object header;
    ASSERT_TRUE(Veldrin::IO::deserializeHeader(input, header, nullptr));
    EXPECT_EQ(stream.tellg(), std::streampos(82));
    EXPECT_EQ(header.keys(), (Nexil::Array<Nexil::String>{"file_identifier", "file_version", "compression_level",
                                                          "serialize_handles"}));
    EXPECT_EQ(getPropertyAs<unsigned int>(header, Veldrin::IO::sStreamVersion), 6u);
    EXPECT_EQ(getPropertyAs<int>(header, Veldrin::IO::sCompressionLevel), 3);
    EXPECT_TRUE(header.getProperty(Veldrin::IO::sStreamHandles).get<bool>());
}

TEST(StreamFailure, NamesThePathAndLeavesTheOutputAlone)
{
    std::string const kept = testing::TempDir() + "veldrin_kept.zon";
    std::ofstream(kept) << "kept";
    Nexil::String const cutPath("/dev/null\0more", 14);
    support::Messages messages;
    auto const writes = [&](Nexil::String const& path, int level) {
        Veldrin::IO::SerializationOptions options;
        options.compressionLevel = level;
        return Veldrin::IO::serialize(listOf("n", 1), path, options, &messages);
    };
    EXPECT_FALSE(writes("/no/such/folder/a.zon", 9));
    EXPECT_FALSE(writes("/dev/full", 9));
    EXPECT_FALSE(writes(cutPath, 9));
    EXPECT_FALSE(writes(kept.c_str(), 10));
    EXPECT_EQ(support::fileBytes(kept), "kept");
    std::remove(kept.c_str());
    support::Objects out{ObjectPtr()};
    Veldrin::Object header;
    for (Nexil::String const& path : {Nexil::String("/dev"), Nexil::String("/no/such/file"), cutPath})
        EXPECT_FALSE(Veldrin::IO::deserialize(path, out, {}, &messages));
    EXPECT_FALSE(Veldrin::IO::deserializeHeader("/no/such/file", header, &messages));
    EXPECT_FALSE(Veldrin::IO::deserialize("/dev/null", out, {}, nullptr));
    std::string const cut(cutPath.view());
    EXPECT_THAT(messages.errors(),
                ElementsAre("Cannot open file for writing: /no/such/folder/a.zon", "Cannot write to file: /dev/full",
                            "Cannot open file for writing: " + cut, "compression error", "Cannot read from file: /dev",
                            "Cannot open file for reading: /no/such/file", "Cannot open file for reading: " + cut,
                            "Cannot open file for reading: /no/such/file"));
    EXPECT_EQ(out.size(), 1u);
    EXPECT_TRUE(header.empty());
}

TEST(StreamFailure, ACancelledJobAnswersFalseWithoutAMessage)
{
    std::string const bytes = support::written(listOf("n", 1));
    Nexil::setJobCancelHook([] { return true; });
    EXPECT_TRUE(refusal(listOf("n", 1)).empty());
    auto const result = support::read(bytes);
    Nexil::setJobCancelHook(nullptr);
    EXPECT_FALSE(result.isRead);
    EXPECT_EQ(result.errors.size() + result.objects.size(), 0u);
}

TEST(StreamRoundTrip, ArraysAboveFourGibibytes)
{
    if (!std::getenv("VELDRIN_TEST_HUGE"))
        GTEST_SKIP() << "needs 10 GB of memory and 5 GB of disk: set VELDRIN_TEST_HUGE";
    std::uint64_t const size = (std::uint64_t(4) << 30) + 5;
    Nexil::Array<unsigned char> bytes;
    bytes.resize(size);
    for (std::uint64_t i = 0; i < size; i += 4093)
        bytes[i] = static_cast<unsigned char>(i >> 3);
    auto const objects = listOf("bytes", Nexil::makePtr<Nexil::Array<unsigned char>>(std::move(bytes)));
    std::string const path = testing::TempDir() + "veldrin_huge.zon";
    for (int const level : {0, 1}) {
        Veldrin::IO::SerializationOptions options;
        options.compressionLevel = level;
        ASSERT_TRUE(Veldrin::IO::serialize(objects, path.c_str(), options, nullptr));
        support::Objects back;
        ASSERT_TRUE(Veldrin::IO::deserialize(path.c_str(), back, {}, nullptr));
        EXPECT_TRUE(*getPropertyAs<Bytes>(*back[0], "bytes") == *getPropertyAs<Bytes>(*objects[0], "bytes")) << level;
    }
    std::remove(path.c_str());
}

} // namespace
