#include <support/Geometry.h>

#include <veldrin/algorithms/ComponentConversion.h>

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace Veldrin::Geometry;
using Mask = Nexil::Array<bool>;
using Style = TagConversionStyle;

Mask maskOf(std::size_t count)
{
    Mask mask;
    mask.resize(count);
    return mask;
}

enum class Offsets { Rise, Overlap, ReachBeyond };

/// A mesh of faces of 0 to 6 corners over random points, some of them used twice, never or not there; and strands with the
/// corners as their points.
struct Sample {
    Nexil::MutablePtr<Veldrin::Object> mesh, strands;
    std::vector<unsigned int> corners, offsets{0};
    std::size_t pointCount;

    Sample(std::mt19937& random, std::size_t faceCount, Offsets how) : pointCount(faceCount / 2 + 3)
    {
        for (std::size_t face = 0; face < faceCount; ++face) {
            for (auto k = random() % 7; k > 0; --k)
                corners.push_back(random() % 50 == 0 ? 0xFFFFFFFFu - static_cast<unsigned int>(random() % 9)
                                                     : static_cast<unsigned int>(random() % pointCount));
            offsets.push_back(static_cast<unsigned int>(corners.size()));
        }
        if (corners.empty())
            corners.push_back(0);
        if (how != Offsets::Rise)
            for (unsigned int& offset : offsets)
                offset = static_cast<unsigned int>(random() % (corners.size() + 1));
        if (how == Offsets::ReachBeyond)
            for (unsigned int& offset : offsets)
                offset = random() % 4 == 0 ? offset + 4000000000u : offset;
        mesh = support::mesh(std::vector<Veldrin::Math::float3>(pointCount), corners, offsets);
        strands = support::strands(std::vector<Veldrin::Math::float3>(corners.size()), offsets);
    }

    /// Calls visit(face, place) for the places below `limit` that each face owns.
    template <class Visit>
    void forEachOwned(std::size_t limit, Visit const& visit) const
    {
        for (std::size_t i = 0; i + 1 < offsets.size(); ++i)
            for (std::size_t k = offsets[i]; k < std::min<std::size_t>(offsets[i + 1], limit); ++k)
                visit(i, k);
    }

    /// The faces selected by the definition. isSelected: of a place below `limit`.
    template <class IsSelected>
    Mask gathered(std::size_t limit, Style style, IsSelected const& isSelected) const
    {
        Mask result = maskOf(offsets.size() - 1);
        Mask missed = result;
        forEachOwned(limit, [&](std::size_t i, std::size_t k) { (isSelected(k) ? result : missed)[i] = true; });
        for (std::size_t i = 0; style == Style::AllElements && i < result.size(); ++i)
            result[i] = result[i] && !missed[i];
        return result;
    }
};

void expectDefinition(Sample const& s, std::mt19937& random, int extra)
{
    // Masks may be shorter or longer than their component.
    auto const sized = [&](std::size_t count) {
        Mask mask = maskOf(static_cast<std::size_t>(std::max(0, static_cast<int>(count) + extra)));
        auto const share = 2 + random() % 7;
        for (bool& flag : mask)
            flag = random() % share != 0;
        return mask;
    };
    std::size_t const faceCount = s.offsets.size() - 1;
    std::size_t const cornerCount = s.corners.size();
    Mask const ofCorners = sized(cornerCount);
    Mask const ofFaces = sized(faceCount);
    Mask const ofPoints = sized(s.pointCount);
    auto const corner = [&](std::size_t k) { return k < std::min(cornerCount, ofCorners.size()) && ofCorners[k]; };
    auto const face = [&](std::size_t i) { return i < std::min(faceCount, ofFaces.size()) && ofFaces[i]; };
    auto const pointOf = [&](std::size_t k) {
        return s.corners[k] < std::min(s.pointCount, ofPoints.size()) && ofPoints[s.corners[k]];
    };
    bool ok = false;
    for (Style const style : {Style::AnyElement, Style::AllElements, static_cast<Style>(7)}) {
        // All beyond the corners is unselected.
        auto const expected = s.gathered(cornerCount + 1, style, corner);
        EXPECT_EQ(*faceVerticesToFaces(*s.mesh, ofCorners, style, &ok), expected);
        EXPECT_EQ(*pointsToStrands(*s.strands, ofCorners, style, &ok), expected);
        EXPECT_EQ(*pointsToFaces(*s.mesh, ofPoints, style, &ok), s.gathered(cornerCount, style, pointOf));
    }
    Mask reached = maskOf(cornerCount);
    Mask reachedPoints = maskOf(s.pointCount);
    auto const reachPoint = [&](Mask& points, std::size_t k) {
        if (s.corners[k] < s.pointCount)
            points[s.corners[k]] = true;
    };
    s.forEachOwned(cornerCount, [&](std::size_t i, std::size_t k) {
        if (face(i)) {
            reached[k] = true;
            reachPoint(reachedPoints, k);
        }
    });
    EXPECT_EQ(*facesToFaceVertices(*s.mesh, ofFaces, &ok), reached);
    EXPECT_EQ(*strandsToPoints(*s.strands, ofFaces, &ok), reached);
    EXPECT_EQ(*facesToPoints(*s.mesh, ofFaces, &ok), reachedPoints);
    Mask toCorners = maskOf(cornerCount);
    Mask toPoints = maskOf(s.pointCount);
    for (std::size_t k = 0; k < cornerCount; ++k) {
        toCorners[k] = pointOf(k);
        if (corner(k))
            reachPoint(toPoints, k);
    }
    EXPECT_EQ(*faceVerticesToPoints(*s.mesh, ofCorners, &ok), toPoints);
    EXPECT_EQ(*pointsToFaceVertices(*s.mesh, ofPoints, &ok), toCorners);
    EXPECT_TRUE(ok);
}

TEST(ComponentConversion, FollowsTheDefinitionForMasksOfAnySizeOnAnyNumberOfThreads)
{
    support::onThreadCounts([] {
        std::mt19937 random(5);
        for (auto const how : {Offsets::Rise, Offsets::Overlap, Offsets::ReachBeyond})
            for (std::size_t const faceCount : {0u, 1u, 7u, 20u, 33u, 60u, 30u, 5000u}) {
                if (faceCount == 5000 && how != Offsets::Rise)
                    continue; // the definition takes the square of the time
                Sample const sample(random, faceCount, how);
                for (int const extra : {-3, 0, 5}) {
                    SCOPED_TRACE(testing::Message() << static_cast<int>(how) << ' ' << faceCount << ' ' << extra);
                    expectDefinition(sample, random, extra);
                }
            }
    });
}

} // namespace
