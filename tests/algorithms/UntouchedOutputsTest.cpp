#include "EdgeOracle.h"

#include <nexil/JobCancel.h>
#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/algorithms/FaceVertexAdjacency.h>
#include <veldrin/algorithms/HalfEdgeDataStructure.h>
#include <veldrin/algorithms/MeshDiagnostic.h>
#include <veldrin/algorithms/MeshInvariants.h>
#include <veldrin/algorithms/MeshNormals.h>
#include <veldrin/algorithms/NormalsTopology.h>
#include <veldrin/algorithms/StrandMeasures.h>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <stdexcept>

// What a cancelled algorithm, or one that finds no whole geometry, leaves to its caller: all outputs as they were.

namespace {

using namespace Veldrin;
using namespace Veldrin::GeometryAlgorithms;
using Geometry::Mesh::FaceEdge;
using Geometry::Mesh::HalfEdgeDataStructure;
using Math::float3;

std::atomic<int> questions;
std::atomic<int> patience;

/// Counts the questions of a run that is never cancelled, or cancelled at the question after `patience` others.
struct Hook {
    explicit Hook(int questionCount)
    {
        questions = 0;
        patience = questionCount;
        Nexil::setJobCancelHook([] { return ++questions > patience; });
    }
    ~Hook() { Nexil::setJobCancelHook(nullptr); }
};

// Faces, or strands, that a kernel goes through at most between two questions.
constexpr unsigned int kMostBetween = 4096;
constexpr int kNever = 1 << 30;

/// Outputs that no algorithm gives, by which one that was touched is known.
struct Outputs {
    Nexil::Array<float3> vectors{{7, 7, 7}};
    Nexil::Array<float> floats{7};
    Nexil::Array<float> moreFloats{7};
    Nexil::Array<FaceEdge> edges{FaceEdge{7, 7}};
    Nexil::Array<FaceEdge> pointFaces{FaceEdge{7, 7}};
    Nexil::Array<unsigned int> indices{7u};
    unsigned int count = 7;

    /// room: of each array, as those of callers that compute again and again.
    explicit Outputs(std::uint64_t room = 0)
    {
        auto const reserve = [&](auto&... arrays) { (arrays.reserve(room), ...); };
        reserve(vectors, floats, moreFloats, edges, pointFaces, indices);
    }
    bool operator==(Outputs const&) const = default;
};

struct Algorithm {
    char const* name;
    /// False when it tells that there is nothing to compute.
    std::function<bool(Object const&, Outputs&)> run;
};

Algorithm vertexNormals(bool byAngle, bool byArea)
{
    return {"vertex normals", [=](Object const& mesh, Outputs& out) {
                computeMeshVertexNormals(mesh, byAngle, byArea, out.vectors);
                return out.vectors.size() > 1;
            }};
}

std::vector<Algorithm> const kOfPositions{
    {"face normals",
     [](Object const& mesh, Outputs& out) {
         computeMeshFaceNormals(mesh, out.vectors);
         return out.vectors.size() > 1;
     }},
    {"diagnose",
     [](Object const& mesh, Outputs&) { return !(Geometry::Mesh::diagnose(mesh) == Geometry::Mesh::Diagnostic{}); }},
    vertexNormals(false, false),
    vertexNormals(false, true),
    vertexNormals(true, false),
    vertexNormals(true, true)};

std::vector<Algorithm> const kOfTopology{
    {"normals topology",
     [](Object const& mesh, Outputs& out) {
         computeMeshNormalsTopology(mesh, {}, 0.5f, out.indices, out.count, nullptr);
         return out.count != 7;
     }},
    {"adjacency",
     [](Object const& mesh, Outputs& out) {
         return buildFaceVertexAdjacency(mesh, out.edges, out.pointFaces, out.indices, nullptr);
     }},
    {"edges",
     [](Object const& mesh, Outputs&) {
         HalfEdgeDataStructure const table(mesh);
         return table.edgeCount() > 0 || table.findEdge(0, 1).faceCount > 0;
     }},
    {"Euler", [](Object const& mesh, Outputs&) { return Geometry::Mesh::eulerCharacteristic(mesh) != 0; }},
    {"components", [](Object const& mesh, Outputs&) { return Geometry::Mesh::connectedComponents(mesh) != -1; }},
    {"Betti", [](Object const& mesh, Outputs&) { return Geometry::Mesh::bettiNumbers(mesh) != Math::int3{}; }}};

/// A conversion answers with a mask of its own.
std::vector<Algorithm> const kConversions{{"points to faces", [](Object const& mesh, Outputs&) {
                                               bool isFine = false;
                                               (void)Geometry::pointsToFaces(
                                                   mesh, {true}, Geometry::TagConversionStyle::AllElements, &isFine);
                                               return isFine;
                                           }}};

std::vector<Algorithm> const kOfStrands{
    {"tangents",
     [](Object const& strands, Outputs& out) { return computeStrandTangents(strands, out.vectors, nullptr); }},
    {"lengths", [](Object const& strands,
                   Outputs& out) { return computeStrandLength(strands, out.floats, out.moreFloats, nullptr); }},
    {"ratios", [](Object const& strands, Outputs& out) { return computeStrandRatio(strands, out.floats, nullptr); }},
};

void expectCancelledAtAnyQuestion(Algorithm const& algorithm, Object const& object, std::size_t threadCount,
                                  std::uint64_t room, unsigned int faceCount)
{
    tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, threadCount);
    tbb::task_arena(static_cast<int>(threadCount)).execute([&] {
        SCOPED_TRACE(testing::Message() << algorithm.name << " on " << threadCount << " threads");
        int wholeRun = 0;
        {
            Hook const hook(kNever);
            Outputs out(room);
            (void)algorithm.run(object, out);
            wholeRun = questions;
        }
        EXPECT_GE(wholeRun, static_cast<int>(faceCount / kMostBetween));
        // Several threads cut the work otherwise each time: then only so many questions are certain.
        int const late = threadCount == 1 ? wholeRun - 1 : static_cast<int>(faceCount / kMostBetween) - 1;
        for (int const questionCount : {0, 1, late / 2, late}) {
            Outputs out(room);
            Hook const hook(questionCount);
            EXPECT_THROW((void)algorithm.run(object, out), std::runtime_error) << questionCount << " of " << wholeRun;
            EXPECT_EQ(out, Outputs()) << questionCount;
            // Every thread may be in a chunk of its own when the answer comes.
            EXPECT_LE(questions, questionCount + 4 * static_cast<int>(threadCount));
        }
    });
}

TEST(UntouchedOutputs, OfACancelledJobThatIsAskedForOnceAChunk)
{
    struct {
        unsigned int side, stride;
        std::size_t threadCount;
        bool haveRoom;
    } const rows[] = {
        {160, 1, 1, false},
        {160, 1, 2, true},
        {370, 1, 3, true},     // more points than one thread adds the normals of: each its own part,
        {370, 7919, 6, false}, // or, where neighbours have far numbers, its own stripe
    };
    for (auto const& [side, stride, threadCount, haveRoom] : rows) {
        unsigned int const count = side * side;
        std::uint64_t const room = haveRoom ? 4 * count : 0;
        auto const mesh = support::meshOn(count, support::torusFaces(side, stride));
        for (auto const* algorithms : {&kOfPositions, &kOfTopology, &kConversions})
            for (auto const& algorithm : *algorithms)
                expectCancelledAtAnyQuestion(algorithm, *mesh, threadCount, room, count);
        std::vector<unsigned int> offsets(count + 1);
        for (unsigned int i = 0; i <= count; ++i)
            offsets[i] = 2 * i;
        auto const strands = createObject();
        Geometry::populateStrand(support::array(std::vector<float3>(2 * count, float3{1, 2, 3})),
                                 support::array(offsets), *strands);
        for (auto const& algorithm : kOfStrands)
            expectCancelledAtAnyQuestion(algorithm, *strands, threadCount, room, count);
    }
}

using Change = std::function<void(Object&)>;

Change without(char const* name)
{
    return [=](Object& object) { object.eraseProperty(name); };
}

Change counting(char const* component, unsigned int count)
{
    return [=](Object& object) { Geometry::setElementCount(component, count, object); };
}

template <class Make>
void expectNothing(std::vector<Algorithm> const& algorithms, Make const& make, std::vector<Change> const& changes)
{
    for (auto const& algorithm : algorithms)
        for (auto const& change : changes) {
            SCOPED_TRACE(testing::Message() << algorithm.name << ", change " << &change - changes.data());
            auto const object = make();
            Outputs out;
            EXPECT_TRUE(algorithm.run(*object, out)) << "while it is whole";
            change(*object);
            Outputs untouched;
            EXPECT_FALSE(algorithm.run(*object, untouched));
            EXPECT_EQ(untouched, Outputs());
        }
}

TEST(UntouchedOutputs, WhereThereIsNoWholeGeometry)
{
    auto const mesh = [] { return support::meshOn(4, {{0, 1, 2}, {0, 1}, {0, 2, 3, 2}}); };
    for (auto const* algorithms : {&kOfPositions, &kOfTopology})
        expectNothing(*algorithms, mesh,
                      {without(Geometry::sFaceVertex), without(Geometry::sFaceOffset), counting(Geometry::sFaceComp, 4),
                       [](Object& object) { object.eraseAllProperties(); }});
    expectNothing(kConversions, mesh, {without(Geometry::sFaceVertex), without(Geometry::sFaceOffset)});
    expectNothing(kOfPositions, mesh, {without(Geometry::sPointPosition), counting(Geometry::sPointComp, 5)});
    expectNothing({kOfTopology[1]}, mesh, {counting(Geometry::sPointComp, 3)}); // a face names a point beyond
    auto const strands = [] {
        return support::filled([](Object& object) {
            Geometry::populateStrand(support::array<float3>({{}, {}, {}}), support::array<unsigned int>({0, 3}),
                                     object);
        });
    };
    expectNothing(kOfStrands, strands, {without(Geometry::sStrandOffset)});
    expectNothing(
        {kOfStrands[0], kOfStrands[1]}, strands,
        {counting(Geometry::sStrandComp, 2), counting(Geometry::sPointComp, 4), without(Geometry::sPointPosition)});

    // A mesh without faces or points is one.
    auto const empty = support::filled([](Object& object) { Geometry::populateMesh(object); });
    Outputs out;
    EXPECT_TRUE(kOfTopology[1].run(*empty, out));
    EXPECT_EQ(out.indices, (Nexil::Array<unsigned int>{0}));
    EXPECT_EQ(Geometry::Mesh::connectedComponents(*empty), 0);
    // Conversions answer with a mask of the right size; what needs corners alone still works.
    auto const broken = mesh();
    broken->eraseProperty(Geometry::sFaceOffset);
    bool isFine = true;
    EXPECT_EQ(*Geometry::facesToPoints(*broken, {true}, &isFine), (Nexil::Array<bool>{false, false, false, false}));
    EXPECT_FALSE(isFine);
    EXPECT_EQ(Geometry::pointsToFaces(*broken, {true}, {}, nullptr)->size(), 3u);
    EXPECT_TRUE((*Geometry::pointsToFaceVertices(*broken, {false, true}, &isFine))[1]);
    EXPECT_TRUE(isFine);
}

} // namespace
