#include <support/Environment.h>
#include <support/Geometry.h>
#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <nexil/JobCancel.h>
#include <veldrin/io/StreamKeys.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <xxhash.h>

#include <numeric>

namespace {

using Veldrin::createObject;
using Veldrin::getPropertyAs;
using Veldrin::setProperty;
using ObjectPtr = Nexil::Ptr<Veldrin::Object>;
using Floats = Nexil::Ptr<Nexil::Array<float>>;

constexpr char kChunkLimit[] = "VELDRIN_MAX_SERIALIZATION_ARRAY_SIZE";

Nexil::MutablePtr<Veldrin::Object> objectWith(char const* key, Nexil::Any value)
{
    auto object = createObject();
    object->setPropertyAny(key, std::move(value));
    return object;
}

ObjectPtr readOne(std::string const& bytes)
{
    auto const result = support::read(bytes);
    EXPECT_TRUE(result.isRead) << testing::PrintToString(result.errors);
    return result.objects.size() == 1 ? result.objects[0] : ObjectPtr();
}

TEST(StreamRoundTrip, EveryTypeAtEveryLevelAndChunkLimit)
{
    auto const kept = support::read(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/v6_every_type_level0.zon"));
    std::string const expected = support::describeObjects(kept.objects);
    ASSERT_EQ(kept.objects[0]->size(), 370u);
    for (int const level : {0, 1, 9})
        for (char const* limit : {"1", "1000", "99999999999999999999"}) {
            support::EnvironmentVariable const variable(kChunkLimit, limit);
            auto const again = support::read(support::written(kept.objects, level));
            EXPECT_TRUE(again.isRead);
            EXPECT_EQ(support::describeObjects(again.objects), expected) << "level " << level << ", limit " << limit;
        }
}

TEST(StreamRoundTrip, ChunksAreCutWhereTheVariableSays)
{
    std::vector<float> values(1001);
    std::iota(values.begin(), values.end(), 0.0f);
    support::Objects const objects{objectWith("values", support::array(values))};
    std::string const whole(reinterpret_cast<char const*>(values.data()), 4004);
    {
        support::EnvironmentVariable const variable(kChunkLimit, "1000");
        std::string const bytes = support::written(objects, 0);
        // Count 1001, five chunks: four of 1000 bytes and one of 4, each the array's own memory.
        auto at = bytes.find(std::string("\x92\x00\x92\xCD\x03\xE9\x95", 7));
        ASSERT_NE(at, std::string::npos);
        at += 7;
        for (std::size_t i = 0; i < 4; ++i, at += 1003) {
            EXPECT_EQ(bytes.substr(at, 3), "\xC5\x03\xE8");
            EXPECT_EQ(bytes.substr(at + 3, 1000), whole.substr(i * 1000, 1000));
        }
        EXPECT_EQ(bytes.substr(at, 6), std::string("\xC4\x04", 2) + whole.substr(4000));
    }
    // What is no number, or none above 0, means chunks of one byte.
    for (auto const& [text, cutsBytes] :
         std::initializer_list<std::pair<char const*, bool>>{{"0", true},
                                                             {"-5", true},
                                                             {"many", true},
                                                             {"", true},
                                                             {" \t1x", true},
                                                             {"+1", true},
                                                             {"4004", false},
                                                             {"99999999999999999999999", false}}) {
        support::EnvironmentVariable const variable(kChunkLimit, text);
        std::string const bytes = support::written(objects, 0);
        EXPECT_EQ(bytes.find(whole) == std::string::npos, cutsBytes) << '"' << text << '"';
        EXPECT_EQ(bytes.size() > 3 * whole.size(), cutsBytes) << '"' << text << '"';
    }
}

TEST(StreamRoundTrip, LongArraysComeBackThroughTheWindowAndBesideIt)
{
    // Sizes around the point from which on bytes go straight from the stream into the array.
    for (std::uint64_t const size : {65535u, 65536u, 65537u, 300000u})
        for (int const level : {0, 9}) {
            std::vector<unsigned char> bytes(size);
            for (std::uint64_t i = 0; i < size; ++i)
                bytes[i] = static_cast<unsigned char>(i * i >> 7);
            auto object = objectWith("first", support::array(bytes));
            setProperty(*object, "between", 7);
            setProperty(*object, "second", support::array(bytes));
            support::Objects const objects{ObjectPtr(std::move(object))};
            std::string stream = support::written(objects, level);
            EXPECT_EQ(support::describeObjects(support::read(stream).objects), support::describeObjects(objects));
            stream[stream.size() / 2] = static_cast<char>(stream[stream.size() / 2] ^ 4);
            EXPECT_THAT(support::read(stream).errors, testing::ElementsAre("Checksum mismatch"));
        }
}

TEST(StreamRoundTrip, TwinTypesComeBackAsTheCanonicalOnes)
{
    auto object = objectWith("u", 5ul);
    setProperty(*object, "s", -5l);
    setProperty(*object, "v", Veldrin::Math::Vector<long, 2>{1, -2});
    setProperty(*object, "a", support::array<unsigned long>({1, 2}));
    auto const back = readOne(support::written({ObjectPtr(std::move(object))}, 0));
    EXPECT_EQ(getPropertyAs<unsigned long long>(*back, "u"), 5u);
    EXPECT_EQ(getPropertyAs<long long>(*back, "s"), -5);
    EXPECT_EQ(getPropertyAs<Veldrin::Math::long2>(*back, "v"), (Veldrin::Math::long2{1, -2}));
    auto const array = getPropertyAs<Nexil::Ptr<Nexil::Array<unsigned long long>>>(*back, "a");
    ASSERT_TRUE(array);
    EXPECT_EQ(*array, (Nexil::Array<unsigned long long>{1, 2}));
}

TEST(StreamRoundTrip, SharingSurvivesAndCopyOnWriteDoesNotCopyAfterReading)
{
    auto const data = support::array<float>({1, 2, 3});
    ObjectPtr const part = objectWith("data", data);
    auto whole = objectWith("part", part);
    setProperty(*whole, "data", data);
    setProperty(*whole, "own", support::array<float>({4}));
    ObjectPtr const first(std::move(whole));
    auto result = support::read(support::written({first, part, ObjectPtr(), first}));
    ASSERT_EQ(result.objects.size(), 4u);
    EXPECT_EQ(result.objects[0], result.objects[3]);
    EXPECT_FALSE(result.objects[2]);
    EXPECT_EQ(getPropertyAs<ObjectPtr>(*result.objects[0], "part"), result.objects[1]);
    EXPECT_EQ(getPropertyAs<Floats>(*result.objects[0], "data"), getPropertyAs<Floats>(*result.objects[1], "data"));

    // Nothing of the reader still holds on to what it gave away.
    EXPECT_EQ(result.objects[1].useCount(), 2u);
    EXPECT_EQ(getPropertyAs<Floats>(*result.objects[0], "own").useCount(), 2u);
    EXPECT_EQ(getPropertyAs<Floats>(*result.objects[0], "data").useCount(), 3u);
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

TEST(StreamRoundTrip, AnObjectThatHoldsItselfIsRefused)
{
    ObjectPtr const inner = objectWith("n", 1);
    ObjectPtr const outer = objectWith("inner", inner);
    // No public way leads to a cycle; a host with its own object classes can still hand one in.
    const_cast<Veldrin::Object&>(*inner).setPropertyAny("outer", outer);
    support::Messages messages;
    EXPECT_EQ(support::written({outer}, 0, &messages), "");
    EXPECT_THAT(messages.errors(), testing::ElementsAre("Bad parent"));
    const_cast<Veldrin::Object&>(*inner).eraseProperty("outer");
}

TEST(StreamRoundTrip, AClassThatMakesItsPropertiesUpIsAskedOnce)
{
    /// Answers a new array at every question, and a new object of its class.
    class Inventor : public Veldrin::Object {
    public:
        explicit Inventor(int depth) : depth_(depth) {}
        [[nodiscard]] Nexil::Array<Nexil::String> keys() const override { return {"numbers", "next"}; }
        [[nodiscard]] Nexil::Any getProperty(Nexil::String const& key) const override
        {
            if (key == "numbers")
                return support::array<int>({1, depth_});
            return depth_ == 0 ? ObjectPtr() : ObjectPtr(Nexil::makePtr<Inventor>(depth_ - 1));
        }

    private:
        int depth_;
    };
    // Values become entries of their own from the 33rd level on.
    for (int const levels : {0, 31, 32, 33, 300}) {
        ObjectPtr held = Nexil::makePtr<Inventor>(1);
        for (int i = 0; i < levels; ++i)
            held = objectWith("next", std::move(held));
        ObjectPtr back = readOne(support::written({held}));
        for (int i = 0; back && i < levels + 1; ++i)
            back = getPropertyAs<ObjectPtr>(*back, "next");
        ASSERT_TRUE(back) << levels;
        EXPECT_EQ(*getPropertyAs<Nexil::Ptr<Nexil::Array<int>>>(*back, "numbers"), (Nexil::Array<int>{1, 0}));

        back = readOne(support::written({ObjectPtr(Nexil::makePtr<Inventor>(levels))}));
        for (int i = 0; back && i < levels; ++i)
            back = getPropertyAs<ObjectPtr>(*back, "next");
        EXPECT_TRUE(back && back->hasProperty("numbers")) << levels;
    }
}

TEST(StreamRoundTrip, UnknownTypesAreLeftOutWithAWarning)
{
    struct Secret {
        int value;
    };
    auto object = objectWith("before", 1);
    setProperty(*object, "hidden", Secret{2});
    object->setPropertyAny("nothing", {});
    setProperty(*object, "after", 3);
    support::Messages messages;
    auto const back = readOne(support::written({ObjectPtr(std::move(object))}, 9, &messages));
    EXPECT_EQ(back->keys(), (Nexil::Array<Nexil::String>{"before", "nothing", "after"}));
    EXPECT_TRUE(back->getProperty("nothing").empty());
    auto const warnings = messages.texts(Nexil::RuntimeMessageCategory::Warning);
    ASSERT_EQ(warnings.size(), 1u);
    EXPECT_THAT(warnings[0], testing::StartsWith("Property 'hidden' is of the unknown type: '"));
    EXPECT_THAT(warnings[0], testing::EndsWith("Secret'. it will not be serialized."));
    EXPECT_EQ(messages.heard.size(), 1u);

    support::Messages refusal;
    EXPECT_EQ(support::written({objectWith("mixed", support::array<Nexil::Any>({Secret{1}}))}, 9, &refusal), "");
    EXPECT_THAT(refusal.errors(), testing::ElementsAre("Unserializable type found in an Any!"));
}

TEST(StreamRoundTrip, WhatCouldNotBeReadAgainIsNotWritten)
{
    support::Messages messages;
    auto const mode = static_cast<Veldrin::Geometry::Common::DataInterpolationMode>(7);
    EXPECT_EQ(support::written({objectWith("mode", mode)}, 9, &messages), "");
    std::string const path = testing::TempDir() + "veldrin_kept.zon";
    std::ofstream(path) << "kept";
    Veldrin::IO::SerializationOptions options;
    options.compressionLevel = 10;
    EXPECT_FALSE(Veldrin::IO::serialize({objectWith("n", 1)}, path.c_str(), options, &messages));
    EXPECT_EQ(support::fileBytes(path), "kept");
    std::remove(path.c_str());
    Nexil::String const cutPath("/dev/null\0more", 14);
    support::Objects out;
    EXPECT_FALSE(Veldrin::IO::serialize({objectWith("n", 1)}, cutPath, {}, &messages));
    EXPECT_FALSE(Veldrin::IO::deserialize(cutPath, out, {}, &messages));
    std::string const whole(cutPath.view());
    EXPECT_THAT(messages.errors(), testing::ElementsAre("Integral type overflow", "compression error",
                                                        "Cannot open file for writing: " + whole,
                                                        "Cannot open file for reading: " + whole));
}

TEST(StreamRoundTrip, HandlesStoreTheirAddressesAndComeBackAsObjects)
{
    ObjectPtr first = objectWith("n", 1);
    ObjectPtr second = first;
    ObjectPtr null;
    std::ostringstream stream;
    Nexil::OutputStream output(stream);
    ASSERT_TRUE(Veldrin::IO::serialize(Nexil::Array<ObjectPtr*>{&first, &null, &second, &first}, output, {}, nullptr));
    auto const result = support::read(stream.str());
    ASSERT_EQ(result.objects.size(), 4u);
    EXPECT_EQ(result.objects[0], result.objects[2]);
    EXPECT_FALSE(result.objects[1]);
    EXPECT_NE(stream.str().find("serialize_handle_addresses"), std::string::npos);
}

TEST(StreamRoundTrip, AStreamIsReadFromWhereItStandsAndWithoutSeeking)
{
    support::Objects const objects{objectWith("values", support::array<float>({1, 2}))};
    std::stringstream stream;
    stream << "something else";
    Nexil::OutputStream output(stream);
    ASSERT_TRUE(Veldrin::IO::serialize(objects, output, {}, nullptr));
    stream.seekg(14);
    Nexil::InputStream input(stream);
    support::Objects back{objectWith("already", true)};
    ASSERT_TRUE(Veldrin::IO::deserialize(input, back, {}, nullptr));
    ASSERT_EQ(back.size(), 2u);
    EXPECT_EQ(support::describeObjects({back[1]}), support::describeObjects(objects));

    /// Like a pipe: gives its bytes once, in small portions.
    class Pipe : public std::streambuf {
    public:
        explicit Pipe(std::string bytes) : bytes_(std::move(bytes)) {}

    protected:
        int_type underflow() override
        {
            std::size_t const size = std::min<std::size_t>(7, bytes_.size() - given_);
            if (size == 0)
                return traits_type::eof();
            setg(bytes_.data() + given_, bytes_.data() + given_, bytes_.data() + given_ + size);
            given_ += size;
            return traits_type::to_int_type(*gptr());
        }

    private:
        std::string bytes_;
        std::size_t given_ = 0;
    };
    Pipe pipe(support::written(objects));
    std::istream pipeStream(&pipe);
    Nexil::InputStream pipeInput(pipeStream);
    back.clear();
    ASSERT_TRUE(Veldrin::IO::deserialize(pipeInput, back, {}, nullptr));
    EXPECT_EQ(support::describeObjects(back), support::describeObjects(objects));
}

TEST(StreamHeader, IsReadAloneAndNothingBehindIt)
{
    std::stringstream stream(support::written({objectWith("n", 1)}, 3) + "behind");
    Nexil::InputStream input(stream);
    Veldrin::Object header;
    ASSERT_TRUE(Veldrin::IO::deserializeHeader(input, header, nullptr));
    EXPECT_EQ(stream.tellg(), std::streampos(82));
    EXPECT_EQ(header.keys(), (Nexil::Array<Nexil::String>{"file_identifier", "file_version", "compression_level",
                                                          "serialize_handles"}));
    EXPECT_EQ(getPropertyAs<unsigned int>(header, Veldrin::IO::sStreamIdentifier), 6611198u);
    EXPECT_EQ(getPropertyAs<unsigned int>(header, Veldrin::IO::sStreamVersion), 6u);
    EXPECT_EQ(getPropertyAs<int>(header, Veldrin::IO::sCompressionLevel), 3);
    EXPECT_TRUE(header.getProperty(Veldrin::IO::sStreamHandles).get<bool>());
}

TEST(StreamFailure, NamesThePathAndLeavesTheOutputAlone)
{
    support::Objects const objects{objectWith("n", 1)};
    support::Messages messages;
    for (char const* path : {"/no/such/folder/a.zon", "/dev/full"}) {
        EXPECT_FALSE(Veldrin::IO::serialize(objects, path, {}, &messages));
        EXPECT_FALSE(Veldrin::IO::serialize(objects, path, {}, nullptr));
    }
    support::Objects out{ObjectPtr()};
    Veldrin::Object header;
    EXPECT_FALSE(Veldrin::IO::deserialize("/dev", out, {}, &messages));
    EXPECT_FALSE(Veldrin::IO::deserialize("/no/such/file", out, {}, &messages));
    EXPECT_FALSE(Veldrin::IO::deserializeHeader("/no/such/file", header, &messages));
    EXPECT_FALSE(Veldrin::IO::deserialize("/dev/null", out, {}, &messages));
    EXPECT_THAT(messages.errors(),
                testing::ElementsAre("Cannot open file for writing: /no/such/folder/a.zon",
                                     "Cannot write to file: /dev/full", "Cannot read from file: /dev",
                                     "Cannot open file for reading: /no/such/file",
                                     "Cannot open file for reading: /no/such/file", "Unknown msgpack error occurred"));
    EXPECT_EQ(out.size(), 1u);
    EXPECT_TRUE(header.empty());
}

TEST(StreamFailure, StreamsInOddStatesAnswerFalseWithOneMessage)
{
    /// Throws what no library throws.
    class Thrower : public std::streambuf {
        std::streamsize xsputn(char const*, std::streamsize) override { throw 5; }
        std::streamsize xsgetn(char*, std::streamsize) override { throw 5; }
        pos_type seekoff(off_type, std::ios_base::seekdir, std::ios_base::openmode) override { return 0; }
    };
    support::Objects const objects{objectWith("n", 1)};
    std::string const bytes = support::written(objects);
    auto expectRefusals = [&](std::streambuf& buffer, char const* writing, char const* reading) {
        std::iostream stream(&buffer);
        Nexil::OutputStream output(stream);
        Nexil::InputStream input(stream);
        support::Messages messages;
        support::Objects out;
        EXPECT_FALSE(Veldrin::IO::serialize(objects, output, {}, &messages));
        EXPECT_FALSE(Veldrin::IO::deserialize(input, out, {}, &messages));
        EXPECT_THAT(messages.errors(), testing::ElementsAre(writing, reading));
        EXPECT_TRUE(out.empty());
    };
    constexpr char kUnknown[] = "Unknown msgpack error occurred";
    Thrower thrower;
    expectRefusals(thrower, kUnknown, kUnknown);
    std::stringbuf readAlready(bytes, std::ios::in);
    readAlready.pubseekoff(0, std::ios::end, std::ios::in);
    expectRefusals(readAlready, "Cannot write to stream", kUnknown);
    // The table offset cannot be put in its place here.
    std::filebuf appending;
    std::string const path = testing::TempDir() + "veldrin_appended.zon";
    ASSERT_TRUE(appending.open(path, std::ios::out | std::ios::binary | std::ios::app));
    expectRefusals(appending, "Cannot write to stream", kUnknown);
    std::remove(path.c_str());

    std::istringstream strict(bytes.substr(0, 100));
    strict.exceptions(std::ios::failbit | std::ios::badbit | std::ios::eofbit);
    Nexil::InputStream input(strict);
    support::Messages messages;
    support::Objects out;
    EXPECT_FALSE(Veldrin::IO::deserialize(input, out, {}, &messages));
    EXPECT_THAT(messages.errors(), testing::ElementsAre("Corrupt stream header"));
}

TEST(StreamFailure, MoreChunksThanAFileCanCountAreRefused)
{
    // Memory that is never touched.
    Nexil::Array<unsigned char> bytes;
    Nexil::Internal::resizeUninitialized(bytes, (std::uint64_t(1) << 32) + 1);
    support::Objects const objects{objectWith("bytes", Nexil::makePtr<Nexil::Array<unsigned char>>(std::move(bytes)))};
    support::EnvironmentVariable const variable(kChunkLimit, "1");
    for (auto const& [level, message] : {std::pair(0, "Array too large to serialize"), {1, "chunk limit exceeded"}}) {
        support::Messages messages;
        EXPECT_EQ(support::written(objects, level, &messages), "");
        EXPECT_THAT(messages.errors(), testing::ElementsAre(message));
    }
    support::Messages messages;
    EXPECT_EQ(support::written({objectWith("v", Veldrin::Math::float3{1, 2, 3})}, 10, &messages), "");
    EXPECT_THAT(messages.errors(), testing::ElementsAre("compression error"));
}

TEST(StreamFailure, ACancelledJobAnswersFalseWithoutAMessage)
{
    std::string const bytes = support::written({objectWith("n", 1)});
    Nexil::setJobCancelHook([] { return true; });
    support::Messages messages;
    EXPECT_EQ(support::written({objectWith("n", 1)}, 9, &messages), "");
    auto const result = support::read(bytes);
    Nexil::setJobCancelHook(nullptr);
    EXPECT_FALSE(result.isRead);
    EXPECT_EQ(result.errors.size() + messages.heard.size() + result.objects.size(), 0u);
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
    std::uint64_t const hash = XXH3_64bits(bytes.data(), size);
    support::Objects objects{objectWith("bytes", Nexil::makePtr<Nexil::Array<unsigned char>>(std::move(bytes)))};
    std::string const path = testing::TempDir() + "veldrin_huge.zon";
    for (int const level : {0, 1}) {
        Veldrin::IO::SerializationOptions options;
        options.compressionLevel = level;
        ASSERT_TRUE(Veldrin::IO::serialize(objects, path.c_str(), options, nullptr));
        support::Objects back;
        ASSERT_TRUE(Veldrin::IO::deserialize(path.c_str(), back, {}, nullptr));
        auto const array = getPropertyAs<Nexil::Ptr<Nexil::Array<unsigned char>>>(*back[0], "bytes");
        ASSERT_EQ(array->size(), size);
        EXPECT_EQ(XXH3_64bits(array->data(), size), hash) << "level " << level;
    }
    std::remove(path.c_str());
}

} // namespace
