/// Round trips over random objects: each list of them is written at a random level, read, and has to be the same; geometry
/// has to be valid before and after. Prints what went through; ends with 1 at the first difference, naming the seed.
///
///     soak --seconds 1200 [--seed 7]

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
#include <cstring>
#include <string>
#include <vector>

namespace {

using namespace soak;
using Clock = std::chrono::steady_clock;

struct Totals {
    std::uint64_t lists = 0;
    std::uint64_t objects = 0;
    std::uint64_t bytes = 0;
};

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

/// What went wrong; "" when nothing did.
std::string roundTrip(std::uint64_t seed, Totals& totals)
{
    Random random(seed);
    Objects objects;
    std::vector<JudgedObject> geometries;
    for (auto count = 1 + random() % 6; count > 0; --count) {
        if (random() % 2 == 0) {
            geometries.push_back(randomGeometry(random));
            objects.push_back(geometries.back().object);
        } else {
            geometries.push_back({});
            objects.push_back(random() % 16 == 0 ? nullptr : randomObject(random, 3));
        }
    }
    int const level = static_cast<int>(random() % 10);
    auto const bytes = support::written(objects, level);
    auto const again = support::read(bytes);
    if (bytes.empty() || !again.isRead)
        return "not " + std::string(bytes.empty() ? "written" : "read") +
               (again.errors.empty() ? "" : ": " + again.errors[0]);
    if (support::describeObjects(again.objects) != support::describeObjects(objects))
        return "not the same after reading";
    for (std::size_t i = 0; i < geometries.size(); ++i) {
        if (!geometries[i].object)
            continue;
        auto const before = verdictOn(geometries[i].kind, *objects[i]);
        auto const after = verdictOn(geometries[i].kind, *again.objects[i]);
        if (before + after != "")
            return "object " + std::to_string(i) + " is invalid: '" + before + "', read '" + after + "'";
    }
    ++totals.lists;
    totals.objects += objects.size();
    totals.bytes += bytes.size();
    return "";
}

std::uint64_t numberBehind(char const* name, int count, char** arguments, std::uint64_t otherwise)
{
    for (int i = 1; i + 1 < count; ++i)
        if (std::strcmp(arguments[i], name) == 0)
            return std::strtoull(arguments[i + 1], nullptr, 10);
    return otherwise;
}

} // namespace

int main(int count, char** arguments)
{
    auto const seconds = numberBehind("--seconds", count, arguments, 60);
    auto const first = numberBehind("--seed", count, arguments, static_cast<std::uint64_t>(std::time(nullptr)));
    auto const start = Clock::now();
    auto nextReport = start;
    Totals totals;
    auto const print = [&] {
        std::printf("%6.0f s  %10llu lists  %10llu objects  %14llu bytes\n",
                    std::chrono::duration<double>(Clock::now() - start).count(),
                    static_cast<unsigned long long>(totals.lists), static_cast<unsigned long long>(totals.objects),
                    static_cast<unsigned long long>(totals.bytes));
        std::fflush(stdout);
    };
    for (auto seed = first; Clock::now() - start < std::chrono::seconds(seconds); ++seed) {
        if (auto const fault = roundTrip(seed, totals); !fault.empty()) {
            print();
            std::printf("seed %llu: %s\n", static_cast<unsigned long long>(seed), fault.c_str());
            return EXIT_FAILURE;
        }
        if (Clock::now() >= nextReport) {
            print();
            nextReport += std::chrono::seconds(30);
        }
    }
    print();
    std::printf("nothing was lost\n");
    return EXIT_SUCCESS;
}
