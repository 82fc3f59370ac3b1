#include <support/Geometry.h>

#include <veldrin/algorithms/ComponentConversion.h>

#include <gtest/gtest.h>

#include <numeric>
#include <random>

namespace {

using namespace Veldrin::Geometry;
using Veldrin::Object;
using Flags = std::vector<bool>;
using Style = TagConversionStyle;

Nexil::Array<bool> mask(Flags const& flags)
{
    Nexil::Array<bool> made;
    for (bool const flag : flags)
        made.push_back(flag);
    return made;
}

Flags flags(Nexil::Ptr<Nexil::Array<bool>> const& mask)
{
    return mask ? Flags(mask->begin(), mask->end()) : Flags();
}

/// A geometry and its topology as plain vectors, for the definitions below.
struct Sample {
    Nexil::MutablePtr<Object> mesh;
    Nexil::MutablePtr<Object> strands;
    std::vector<unsigned int> corners;
    std::vector<unsigned int> offsets;
    std::size_t pointCount = 0;
};

/// Faces of 0 to 6 corners over random points, some of them used twice or never.
Sample randomSample(unsigned int seed, std::size_t faceCount)
{
    std::mt19937 random(seed);
    Sample sample;
    sample.pointCount = faceCount / 2 + 3;
    sample.offsets.push_back(0);
    for (std::size_t face = 0; face < faceCount; ++face) {
        for (auto k = random() % 7; k > 0; --k)
            sample.corners.push_back(static_cast<unsigned int>(random() % sample.pointCount));
        sample.offsets.push_back(static_cast<unsigned int>(sample.corners.size()));
    }
    if (sample.corners.empty())
        sample.corners.push_back(0);
    std::vector<Veldrin::Math::float3> const points(sample.pointCount);
    sample.mesh = Veldrin::createObject();
    populateMesh(support::array(points), support::array(sample.corners), support::array(sample.offsets), *sample.mesh);
    sample.strands = Veldrin::createObject();
    populateStrand(support::array(std::vector<Veldrin::Math::float3>(sample.corners.size())),
                   support::array(sample.offsets), *sample.strands);
    return sample;
}

Flags randomFlags(unsigned int seed, std::size_t count)
{
    std::mt19937 random(seed);
    Flags made(count);
    for (std::size_t i = 0; i < count; ++i)
        made[i] = random() % 3 != 0;
    return made;
}

bool at(Flags const& source, std::size_t sourceCount, std::size_t i)
{
    return i < source.size() && i < sourceCount && source[i];
}

/// Ranges selected by the definition, counting instead of stopping early. index maps a place in a range to its source.
template <class Index>
Flags gathered(Sample const& sample, Flags const& source, std::size_t sourceCount, Style style, Index const& index)
{
    Flags result;
    for (std::size_t i = 0; i + 1 < sample.offsets.size(); ++i) {
        std::size_t selected = 0;
        std::size_t const size = sample.offsets[i + 1] - sample.offsets[i];
        for (std::size_t k = sample.offsets[i]; k < sample.offsets[i + 1]; ++k)
            selected += at(source, sourceCount, index(k)) ? 1 : 0;
        result.push_back(style == Style::AllElements ? size > 0 && selected == size : selected > 0);
    }
    return result;
}

template <class Index>
Flags scattered(Sample const& sample, Flags const& source, std::size_t targetCount, Index const& index)
{
    Flags result(targetCount);
    for (std::size_t i = 0; i + 1 < sample.offsets.size(); ++i)
        for (std::size_t k = sample.offsets[i]; k < sample.offsets[i + 1]; ++k)
            if (at(source, sample.offsets.size() - 1, i))
                result[index(k)] = true;
    return result;
}

TEST(ComponentConversion, FollowsTheDefinitionForMasksOfAnySizeOnAnyNumberOfThreads)
{
    for (int const threads : {1, 2, 3}) {
        tbb::global_control const limit(tbb::global_control::max_allowed_parallelism,
                                        static_cast<std::size_t>(threads));
        for (unsigned int seed = 0; seed < 12; ++seed) {
            Sample const s = randomSample(seed, seed < 10 ? seed * 7 : 5000);
            std::size_t const faces = s.offsets.size() - 1;
            std::size_t const corners = s.corners.size();
            auto const self = [](std::size_t k) { return k; };
            auto const point = [&](std::size_t k) { return s.corners[k]; };
            for (std::ptrdiff_t const extra : {-3, 0, 5}) {
                auto sized = [&](std::size_t count) {
                    auto const wanted = static_cast<std::ptrdiff_t>(count) + extra;
                    return randomFlags(seed + 100, wanted < 0 ? 0 : static_cast<std::size_t>(wanted));
                };
                Flags const ofCorners = sized(corners);
                Flags const ofFaces = sized(faces);
                Flags const ofPoints = sized(s.pointCount);
                bool ok = false;
                for (Style const style : {Style::AnyElement, Style::AllElements, static_cast<Style>(7)}) {
                    EXPECT_EQ(flags(faceVerticesToFaces(*s.mesh, mask(ofCorners), style, &ok)),
                              gathered(s, ofCorners, corners, style, self));
                    EXPECT_EQ(flags(pointsToFaces(*s.mesh, mask(ofPoints), style, &ok)),
                              gathered(s, ofPoints, s.pointCount, style, point));
                    EXPECT_EQ(flags(pointsToStrands(*s.strands, mask(ofCorners), style, &ok)),
                              gathered(s, ofCorners, corners, style, self));
                }
                EXPECT_EQ(flags(facesToFaceVertices(*s.mesh, mask(ofFaces), &ok)),
                          scattered(s, ofFaces, corners, self));
                EXPECT_EQ(flags(facesToPoints(*s.mesh, mask(ofFaces), &ok)),
                          scattered(s, ofFaces, s.pointCount, point));
                EXPECT_EQ(flags(strandsToPoints(*s.strands, mask(ofFaces), &ok)), scattered(s, ofFaces, corners, self));
                Flags toPoints(s.pointCount);
                Flags toCorners(corners);
                for (std::size_t k = 0; k < corners; ++k) {
                    toCorners[k] = at(ofPoints, s.pointCount, s.corners[k]);
                    if (at(ofCorners, corners, k))
                        toPoints[s.corners[k]] = true;
                }
                EXPECT_EQ(flags(faceVerticesToPoints(*s.mesh, mask(ofCorners), &ok)), toPoints);
                EXPECT_EQ(flags(pointsToFaceVertices(*s.mesh, mask(ofPoints), &ok)), toCorners);
                EXPECT_TRUE(ok);
            }
        }
    }
}

TEST(ComponentConversion, MissingTopologyGivesAnAllFalseMaskOfTheRightSize)
{
    auto mesh = support::mesh({{}, {}, {}}, {{0, 1, 2}});
    mesh->eraseProperty(sFaceOffset);
    bool ok = true;
    EXPECT_EQ(flags(facesToPoints(*mesh, mask({true}), &ok)), Flags(3));
    EXPECT_FALSE(ok);
    EXPECT_EQ(flags(pointsToFaces(*mesh, mask({true, true, true}), Style::AnyElement, nullptr)), Flags(1));
    EXPECT_EQ(flags(strandsToPoints(*mesh, mask({true}), &ok)), Flags(3));
    EXPECT_FALSE(ok);
    // What needs corners alone still works.
    EXPECT_EQ(flags(pointsToFaceVertices(*mesh, mask({false, true}), &ok)), Flags({false, true, false}));
    EXPECT_TRUE(ok);
}

TEST(ComponentConversion, HostileTopologyStaysWithinItsArrays)
{
    auto const mesh = Veldrin::createObject();
    populateMesh(support::array(std::vector<Veldrin::Math::float3>(2)),
                 support::array<unsigned int>({0, 7, 4294967295u, 1}),
                 support::array<unsigned int>({4000000000u, 2, 4294967295u, 1, 3}), *mesh);
    Flags const all(10, true);
    bool ok = false;
    EXPECT_EQ(flags(facesToPoints(*mesh, mask(all), &ok)), Flags({false, true}));
    EXPECT_EQ(flags(faceVerticesToPoints(*mesh, mask(all), &ok)), Flags({true, true}));
    EXPECT_EQ(flags(facesToFaceVertices(*mesh, mask(all), &ok)), Flags({false, true, true, true}));
    EXPECT_EQ(flags(pointsToFaces(*mesh, mask(all), Style::AllElements, &ok)), Flags({false, false, false, false}));
    EXPECT_EQ(flags(pointsToFaces(*mesh, mask(all), Style::AnyElement, &ok)), Flags({false, true, false, false}));
    EXPECT_EQ(flags(faceVerticesToFaces(*mesh, mask(all), Style::AllElements, &ok)),
              Flags({false, false, false, true}));
}

/// A mesh of one-point faces as these offsets have it.
Nexil::MutablePtr<Veldrin::Object> meshWithOffsets(std::vector<unsigned int> const& offsets, unsigned int cornerCount)
{
    std::vector<unsigned int> corners(cornerCount);
    std::iota(corners.begin(), corners.end(), 0u);
    return support::filled([&](Veldrin::Object& mesh) {
        populateMesh(support::array(std::vector<Veldrin::Math::float3>(cornerCount)), support::array(corners),
                     support::array(offsets), mesh);
    });
}

TEST(ComponentConversion, RangesThatOverlapAreEachTakenWhole)
{
    std::mt19937 random(5);
    for (int round = 0; round < 40; ++round) {
        unsigned int const cornerCount = 20;
        std::vector<unsigned int> offsets(31);
        for (unsigned int& offset : offsets)
            offset = static_cast<unsigned int>(random() % (cornerCount + 1));
        auto const mesh = meshWithOffsets(offsets, cornerCount);
        Flags corners(cornerCount);
        for (std::size_t i = 0; i < corners.size(); ++i)
            corners[i] = round % 3 == 0 ? random() % 8 == 0 : random() % 8 != 0;
        Flags any(30), all(30), faces(30), reached(cornerCount);
        for (std::size_t f = 0; f < 30; ++f) {
            faces[f] = random() % 6 == 0;
            unsigned int selected = 0;
            for (unsigned int i = offsets[f]; i < offsets[f + 1]; ++i) {
                selected += corners[i];
                reached[i] = reached[i] || faces[f];
            }
            any[f] = selected > 0;
            all[f] = offsets[f] < offsets[f + 1] && selected == offsets[f + 1] - offsets[f];
        }
        EXPECT_EQ(flags(faceVerticesToFaces(*mesh, mask(corners), Style::AnyElement, nullptr)), any);
        EXPECT_EQ(flags(pointsToFaces(*mesh, mask(corners), Style::AnyElement, nullptr)), any);
        EXPECT_EQ(flags(faceVerticesToFaces(*mesh, mask(corners), Style::AllElements, nullptr)), all);
        EXPECT_EQ(flags(pointsToFaces(*mesh, mask(corners), Style::AllElements, nullptr)), all);
        EXPECT_EQ(flags(facesToFaceVertices(*mesh, mask(faces), nullptr)), reached);
        EXPECT_EQ(flags(facesToPoints(*mesh, mask(faces), nullptr)), reached);
    }
}

TEST(ComponentConversion, OffsetsThatSwingTakeNoMoreThanALinearTime)
{
    // Every other face owns all corners: face by face that would be 5e11 looks.
    constexpr unsigned int kCount = 1000000;
    std::vector<unsigned int> offsets(kCount + 1);
    for (unsigned int f = 0; f <= kCount; ++f)
        offsets[f] = f % 2 * kCount;
    auto const mesh = meshWithOffsets(offsets, kCount);
    Flags selected(kCount, true);
    auto const faces = pointsToFaces(*mesh, mask(selected), Style::AllElements, nullptr);
    EXPECT_TRUE((*faces)[0]);
    EXPECT_FALSE((*faces)[1]);
    EXPECT_TRUE((*facesToPoints(*mesh, mask(selected), nullptr))[kCount - 1]);
    selected.back() = false;
    EXPECT_FALSE((*faceVerticesToFaces(*mesh, mask(selected), Style::AllElements, nullptr))[0]);
}

} // namespace
