/// Round trips over random objects: each list of them is written at a random level, read, and has to be the same to the
/// validators too. Prints what went through; ends with 1 at the first difference, naming the seed.
///
///     soak [SECONDS] [SEED]

#include "../volume/Samples.h"

#include <support/Geometry.h>
#include <support/Streams.h>

#include <veldrin/validation/GeoValidator.h>
#include <veldrin/volume/VolumeConversion.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

using namespace Veldrin;
using ObjectPtr = Nexil::Ptr<Object>;
using Random = std::mt19937_64;
using Clock = std::chrono::steady_clock;

/// A value of each type that a stream can hold, alone, in arrays, and in arrays of arrays: made once, and kept as files.
std::vector<Nexil::Any> const& everyType()
{
    static auto const all = [] {
        std::vector<Nexil::Any> values;
        for (char const* name : {"v6_every_type_level0", "v6_walk", "v6_odd_bytes", "v6_curve_loose"})
            for (auto const& object :
                 support::read(support::fileBytes(VELDRIN_TEST_CORPUS "/streams/valid/" + std::string(name) + ".zon"))
                     .objects)
                for (auto const& key : object ? object->keys() : Nexil::Array<Nexil::String>())
                    values.push_back(object->getProperty(key));
        if (values.size() < 360)
            throw std::runtime_error("the kept streams do not hold every type");
        return values;
    }();
    return all;
}

/// Mostly short, now and then of many chunks; of one value over and over, or of noise.
Nexil::Any randomArray(Random& random)
{
    std::vector<unsigned long long> values(random() % 8 == 0 ? random() % 30000 : random() % 40);
    bool const isNoise = random() % 2 == 0;
    for (std::size_t i = 0; i < values.size(); ++i)
        values[i] = isNoise ? random() : i / 64;
    return support::array(values);
}

Nexil::String randomName(Random& random)
{
    std::string text(random() % 30, ' ');
    for (char& c : text)
        c = static_cast<char>(random());
    return Nexil::String(std::string_view(text)) + "x";
}

/// A bag of properties of any types, of objects `depth` deep, and of values that several properties share.
ObjectPtr randomObject(Random& random, int depth)
{
    if (random() % 16 == 0)
        return Geometry::move_vld_volume_to_object(
            *support::sphereVolume<VLD::TileTree3D::SmallTiles>(static_cast<int>(1 + random() % 8)));
    auto made = createObject();
    if (random() % 4 == 0)
        Geometry::populatePlaneMesh(1, static_cast<unsigned int>(random() % 30), *made);
    for (auto count = random() % 12; count > 0; --count) {
        Nexil::Any value = everyType()[random() % everyType().size()];
        switch (random() % 10) {
        case 0: value = randomArray(random); break;
        case 1:
            if (depth > 0) {
                // One object twice in a list, and a place without any.
                auto const shared = randomObject(random, depth - 1);
                value = support::array<ObjectPtr>({shared, nullptr, shared});
            }
            break;
        case 2: made->setPropertyAny(randomName(random), Nexil::Any(value)); break;
        case 3:
            if (depth > 0)
                value = randomObject(random, depth - 1);
            break;
        default: break;
        }
        made->setPropertyAny(randomName(random), std::move(value));
    }
    return made;
}

std::string verdictOn(ObjectPtr const& object)
{
    return object ? Geometry::GeoValidator().validate(*object).message.c_str() : "";
}

/// What the round trips so far took.
std::uint64_t objectCount = 0, byteCount = 0;

/// What went wrong; "" when nothing did.
std::string roundTrip(std::uint64_t seed)
{
    Random random(seed);
    support::Objects objects;
    for (auto count = 1 + random() % 6; count > 0; --count)
        objects.push_back(random() % 16 == 0 ? nullptr : randomObject(random, 3));
    auto const bytes = support::written(objects, static_cast<int>(random() % 10));
    auto const again = support::read(bytes);
    if (bytes.empty() || !again.isRead)
        return "not " + (bytes.empty() ? "written" : "read: " + again.errors.at(0));
    objectCount += objects.size();
    byteCount += bytes.size();
    if (support::contentOf(again.objects) != support::contentOf(objects))
        return "not the same after reading";
    for (std::uint64_t i = 0; i < objects.size(); ++i)
        if (verdictOn(again.objects[i]) != verdictOn(objects[i]))
            return "judged otherwise after reading: " + verdictOn(again.objects[i]);
    return "";
}

} // namespace

int main(int count, char** arguments)
{
    std::chrono::seconds const duration(count > 1 ? std::atoll(arguments[1]) : 60);
    auto seed =
        count > 2 ? std::strtoull(arguments[2], nullptr, 10) : static_cast<unsigned long long>(std::time(nullptr));
    auto const start = Clock::now();
    std::string fault;
    for (; fault.empty() && Clock::now() - start < duration; ++seed)
        fault = roundTrip(seed);
    std::printf("%llu objects, %llu bytes\nseed %llu: %s\n", static_cast<unsigned long long>(objectCount),
                static_cast<unsigned long long>(byteCount), seed - 1,
                fault.empty() ? "nothing was lost" : fault.c_str());
    return fault.empty() ? EXIT_SUCCESS : EXIT_FAILURE;
}
