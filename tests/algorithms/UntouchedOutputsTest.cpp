#include "EdgeOracle.h"

#include <nexil/JobCancel.h>
#include <veldrin/algorithms/ComponentConversion.h>
#include <veldrin/algorithms/FaceVertexAdjacency.h>
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
using Math::float3;

/// Outputs that no algorithm gives, by which one that was touched is known.
struct Outputs {
    Nexil::Array<float3> vectors{{7, 7, 7}};
    Nexil::Array<float> floats{7}, moreFloats{7};
    Nexil::Array<FaceEdge> edges{FaceEdge{7, 7}}, pointFaces{FaceEdge{7, 7}};
    Nexil::Array<unsigned int> indices{7u};
    unsigned int count = 7;
    /// What it returned, if that tells of anything computed.
    bool isAnswered = false;

    /// room: of each array, as those of callers that compute again and again.
    explicit Outputs(std::uint64_t room = 0)
    {
        auto const reserve = [&](auto&... arrays) { (arrays.reserve(room), ...); };
        reserve(vectors, floats, moreFloats, edges, pointFaces, indices);
    }
    bool operator==(Outputs const&) const = default;
};

using Algorithm = std::function<void(Object const&, Outputs&)>;
using Algorithms = std::vector<std::pair<char const*, Algorithm>>;

Algorithms const kOfPositions{
    {"face normals", [](Object const& mesh, Outputs& out) { computeMeshFaceNormals(mesh, out.vectors); }},
    {"normals", [](Object const& mesh, Outputs& out) { computeMeshVertexNormals(mesh, true, false, out.vectors); }},
    {"diagnose", [](Object const& mesh, Outputs& out) {
         out.isAnswered = !(Geometry::Mesh::diagnose(mesh) == Geometry::Mesh::Diagnostic{});
     }}};

Algorithm const kAdjacency = [](Object const& mesh, Outputs& out) {
    out.isAnswered = buildFaceVertexAdjacency(mesh, out.edges, out.pointFaces, out.indices, nullptr);
};

Algorithms const kOfTopology{
    {"adjacency", kAdjacency},
    {"normals topology",
     [](Object const& mesh, Outputs& out) {
         computeMeshNormalsTopology(mesh, {}, 0.5f, out.indices, out.count, nullptr);
     }},
    {"Euler",
     [](Object const& mesh, Outputs& out) { out.isAnswered = Geometry::Mesh::eulerCharacteristic(mesh) != 0; }},
    {"components",
     [](Object const& mesh, Outputs& out) { out.isAnswered = Geometry::Mesh::connectedComponents(mesh) != -1; }},
    {"Betti",
     [](Object const& mesh, Outputs& out) { out.isAnswered = Geometry::Mesh::bettiNumbers(mesh) != Math::int3{}; }}};

/// A conversion answers with a mask of its own.
Algorithms const kConversions{{"points to faces", [](Object const& mesh, Outputs& out) {
                                   (void)Geometry::pointsToFaces(
                                       mesh, {true}, Geometry::TagConversionStyle::AllElements, &out.isAnswered);
                               }}};

Algorithms const kOfStrandPoints{
    {"tangents", [](Object const& strands,
                    Outputs& out) { out.isAnswered = computeStrandTangents(strands, out.vectors, nullptr); }},
    {"lengths", [](Object const& strands, Outputs& out) {
         out.isAnswered = computeStrandLength(strands, out.floats, out.moreFloats, nullptr);
     }}};

Algorithms const kOfStrands{{"ratios", [](Object const& strands, Outputs& out) {
                                 out.isAnswered = computeStrandRatio(strands, out.floats, nullptr);
                             }}};

std::atomic<int> questions;
std::atomic<int> patience;

/// Counts the questions of a run that is cancelled at the one after `questionCount` others.
struct Hook {
    explicit Hook(int questionCount)
    {
        questions = 0;
        patience = questionCount;
        Nexil::setJobCancelHook([] { return ++questions > patience; });
    }
    ~Hook() { Nexil::setJobCancelHook(nullptr); }
};

/// rangeCount: faces or strands, of which a kernel goes through at most 4096 between two questions.
void expectCancelledAtAnyQuestion(Algorithm const& run, Object const& object, int threadCount, std::uint64_t room,
                                  int rangeCount)
{
    int wholeRun = 0;
    {
        Hook const hook(1 << 30);
        Outputs out(room);
        run(object, out);
        wholeRun = questions;
    }
    EXPECT_GE(wholeRun, rangeCount / 4096);
    // Several threads cut the work otherwise each time: then only so many questions are certain.
    int const late = threadCount == 1 ? wholeRun - 1 : rangeCount / 4096 - 1;
    for (int const questionCount : {0, 1, late / 2, late}) {
        Outputs out(room);
        Hook const hook(questionCount);
        EXPECT_THROW(run(object, out), std::runtime_error) << questionCount << " of " << wholeRun;
        EXPECT_EQ(out, Outputs()) << questionCount;
        // Every thread may be in a chunk of its own when the answer comes.
        EXPECT_LE(questions, questionCount + 4 * threadCount);
    }
}

TEST(UntouchedOutputs, OfACancelledJobThatIsAskedForOnceAChunk)
{
    struct {
        unsigned int side, stride;
        int threadCount;
        bool haveRoom;
    } const rows[] = {
        {160, 1, 1, false},
        {160, 1, 2, true},
        {370, 1, 3, true},     // more points than one thread adds the normals of: each its own part,
        {370, 7919, 6, false}, // or, where neighbours have far numbers, its own stripe
    };
    for (auto const& row : rows) {
        unsigned int const count = row.side * row.side;
        auto const mesh = support::meshOn(count, support::torusFaces(row.side, row.stride));
        std::vector<unsigned int> offsets(count + 1);
        for (unsigned int i = 0; i <= count; ++i)
            offsets[i] = 2 * i;
        auto const strands = createObject();
        Geometry::populateStrand(support::array(std::vector<float3>(2 * count, float3{1, 2, 3})),
                                 support::array(offsets), *strands);
        tbb::global_control const limit(tbb::global_control::max_allowed_parallelism,
                                        static_cast<std::size_t>(row.threadCount));
        for (auto const* algorithms : {&kOfPositions, &kOfTopology, &kConversions, &kOfStrandPoints, &kOfStrands})
            for (auto const& algorithm : *algorithms) {
                SCOPED_TRACE(testing::Message() << algorithm.first << " on " << row.threadCount << " threads");
                bool const isOfStrands = algorithms == &kOfStrandPoints || algorithms == &kOfStrands;
                tbb::task_arena(row.threadCount).execute([&] {
                    expectCancelledAtAnyQuestion(algorithm.second, isOfStrands ? *strands : *mesh, row.threadCount,
                                                 row.haveRoom ? 4 * count : 0, static_cast<int>(count));
                });
            }
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
void expectNothing(Make const& make, std::vector<Change> const& changes,
                   std::initializer_list<Algorithms> const& algorithms)
{
    for (auto const& list : algorithms)
        for (auto const& [name, run] : list)
            for (auto const& change : changes) {
                SCOPED_TRACE(testing::Message() << name << ", change " << &change - changes.data());
                auto const object = make();
                Outputs out;
                run(*object, out);
                EXPECT_NE(out, Outputs()) << "while it is whole";
                change(*object);
                Outputs untouched;
                run(*object, untouched);
                EXPECT_EQ(untouched, Outputs());
            }
}

TEST(UntouchedOutputs, WhereThereIsNoWholeGeometry)
{
    using namespace Geometry;
    auto const mesh = [] { return support::meshOn(4, {{0, 1, 2}, {0, 1}, {0, 2, 3, 2}}); };
    expectNothing(mesh, {without(sFaceVertex), without(sFaceOffset)}, {kOfPositions, kOfTopology, kConversions});
    expectNothing(mesh, {counting(sFaceComp, 4)}, {kOfPositions, kOfTopology});
    expectNothing(mesh, {without(sPointPosition), counting(sPointComp, 5)}, {kOfPositions});
    // A face names a point beyond.
    expectNothing(mesh, {counting(sPointComp, 3)}, {{{"adjacency", kAdjacency}}});
    auto const strands = [] {
        return support::filled([](Object& object) {
            populateStrand(support::array<float3>({{}, {}, {}}), support::array<unsigned int>({0, 3}), object);
        });
    };
    expectNothing(strands, {without(sStrandOffset)}, {kOfStrands});
    expectNothing(strands,
                  {without(sStrandOffset), counting(sStrandComp, 2), counting(sPointComp, 4), without(sPointPosition)},
                  {kOfStrandPoints});
    // Conversions answer with a mask of the right size; what needs corners alone still works.
    auto const broken = mesh();
    broken->eraseProperty(sFaceOffset);
    bool isFine = true;
    EXPECT_EQ(*facesToPoints(*broken, {true}, &isFine), (Nexil::Array<bool>{false, false, false, false}));
    EXPECT_FALSE(isFine);
    EXPECT_TRUE((*pointsToFaceVertices(*broken, {false, true}, &isFine))[1]);
    EXPECT_TRUE(isFine);
}

} // namespace
