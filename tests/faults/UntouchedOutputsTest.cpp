#include "../algorithms/EdgeOracle.h"
#include "../validation/Edits.h"
#include "Operations.h"

#include <veldrin/algorithms/ComponentConversion.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin::Geometry;
using support::count;
using support::without;

/// A small mesh that is a geometry of strands, too.
Nexil::MutablePtr<Veldrin::Object> wholeGeometry()
{
    auto geometry = support::meshOn(4, {{0, 1, 2}, {0, 1}, {0, 2, 3, 2}});
    auto const strands = support::strands(std::vector<Veldrin::Math::float3>(4), {0, 4});
    for (auto const* name : {sStrandComp, sStrandOffset})
        setProperty(*geometry, name, support::part(*strands, name));
    return geometry;
}

TEST(UntouchedOutputs, WhereThereIsNoWholeGeometry)
{
    std::string const normals = "face normals, normals, normals by area, normals by angle, normals by both, diagnose, ";
    std::string const invariants = "Euler, components, Betti, ";
    std::string const topology = "adjacency, normals topology, " + invariants;
    std::string const measures = "tangents, lengths, ";
    struct {
        char const* what;
        support::Change change;
        /// What finds nothing to work on, and leaves its outputs as they were.
        std::string silent;
    } const rows[] = {
        {"whole", [](Veldrin::Object&) {}, ""},
        {"no corners", without(sFaceVertex), normals + topology + "conversion, "},
        {"no offsets", without(sFaceOffset), normals + topology + "conversion, "},
        {"more faces than offsets", count(sFaceComp, 4), normals + topology},
        {"no positions, thus no mesh at all", without(sPointPosition),
         normals + "normals topology, " + invariants + measures + "ratios, "},
        {"more points than positions", count(sPointComp, 5), normals + "normals topology, " + measures},
        {"a face with a point beyond", count(sPointComp, 3), "adjacency, normals topology, "},
        {"no strands", without(sStrandOffset), measures + "ratios, "},
        {"more strands than offsets", count(sStrandComp, 2), measures},
    };
    support::Sample sample;
    for (auto const& row : rows) {
        auto geometry = wholeGeometry();
        row.change(*geometry);
        sample.geometry = std::move(geometry);
        std::string silent;
        for (auto const& algorithm : support::algorithms())
            if (!algorithm.run(sample))
                silent += std::string(algorithm.name) + ", ";
        EXPECT_EQ(silent, row.silent) << row.what;
    }
    // Conversions answer with a mask of the right size; what needs corners alone still works.
    auto const broken = wholeGeometry();
    broken->eraseProperty(sFaceOffset);
    bool isFine = true;
    EXPECT_EQ(*facesToPoints(*broken, {true}, &isFine), (Nexil::Array<bool>{false, false, false, false}));
    EXPECT_FALSE(isFine);
    EXPECT_TRUE((*pointsToFaceVertices(*broken, {false, true}, &isFine))[1]);
    EXPECT_TRUE(isFine);
}

} // namespace
