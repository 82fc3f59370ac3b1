/// Round trips over random objects: each list of them is written at a random level, read, and has to be the same; geometry
/// has to be valid before and after. Prints what went through; ends with 1 at the first difference, naming the seed.
///
///     soak [SECONDS] [SEED]

#include "RandomObjects.h"

#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <veldrin/validation/MeshValidator.h>
#include <veldrin/validation/PointCloudValidator.h>
#include <veldrin/validation/StrandValidator.h>
#include <veldrin/validation/VolumeValidator.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <string>
#include <vector>

namespace {

using namespace soak;
using Clock = std::chrono::steady_clock;

std::string verdictOn(JudgedObject::Kind kind, Veldrin::Object const& object)
{
    using Kind = JudgedObject::Kind;
    switch (kind) {
    case Kind::Mesh: return Veldrin::Geometry::validateMesh(object).message.c_str();
    case Kind::PointCloud: return Veldrin::Geometry::PointCloudValidator().validate(object).message.c_str();
    case Kind::Strands: return Veldrin::Geometry::StrandValidator().validate(object).message.c_str();
    default: return Veldrin::Geometry::VolumeValidator().validate(object).message.c_str();
    }
}

/// What the round trips so far took.
std::uint64_t objectCount = 0, byteCount = 0;

/// What went wrong; "" when nothing did.
std::string roundTrip(std::uint64_t seed)
{
    Random random(seed);
    Objects objects;
    std::vector<JudgedObject> geometries;
    for (auto count = 1 + random() % 6; count > 0; --count) {
        geometries.push_back(random() % 2 == 0 ? randomGeometry(random) : JudgedObject{});
        auto const& geometry = geometries.back().object;
        objects.push_back(geometry || random() % 16 == 0 ? geometry : randomObject(random, 3));
    }
    auto const bytes = support::written(objects, static_cast<int>(random() % 10));
    auto const again = support::read(bytes);
    if (bytes.empty() || !again.isRead)
        return "not " + std::string(bytes.empty() ? "written" : "read: ") +
               (again.errors.empty() ? "" : again.errors[0]);
    if (support::describeObjects(again.objects) != support::describeObjects(objects))
        return "not the same after reading";
    for (std::size_t i = 0; i < geometries.size(); ++i)
        for (auto const& each : {objects[i], again.objects[i]})
            if (auto const verdict = geometries[i].object ? verdictOn(geometries[i].kind, *each) : ""; !verdict.empty())
                return "object " + std::to_string(i) + " is invalid: " + verdict;
    objectCount += objects.size();
    byteCount += bytes.size();
    return "";
}

} // namespace

int main(int count, char** arguments)
{
    std::chrono::seconds const duration(count > 1 ? std::atoll(arguments[1]) : 60);
    auto seed =
        count > 2 ? std::strtoull(arguments[2], nullptr, 10) : static_cast<unsigned long long>(std::time(nullptr));
    auto const start = Clock::now();
    auto nextReport = start;
    std::string fault;
    for (bool isLast = false; !isLast; ++seed) {
        fault = roundTrip(seed);
        isLast = !fault.empty() || Clock::now() - start >= duration;
        if (!isLast && Clock::now() < nextReport)
            continue;
        nextReport += std::chrono::seconds(30);
        std::printf("%6.0f s  %10llu objects  %14llu bytes\n",
                    std::chrono::duration<double>(Clock::now() - start).count(),
                    static_cast<unsigned long long>(objectCount), static_cast<unsigned long long>(byteCount));
        std::fflush(stdout);
    }
    std::printf("seed %llu: %s\n", seed - 1, fault.empty() ? "nothing was lost" : fault.c_str());
    return fault.empty() ? EXIT_SUCCESS : EXIT_FAILURE;
}
