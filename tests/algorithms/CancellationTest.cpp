#include <algorithms/EdgeOracle.h>

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

namespace {

using namespace Veldrin;
using namespace Veldrin::GeometryAlgorithms;
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

constexpr unsigned int kSide = 160;
constexpr unsigned int kFaces = kSide * kSide;
// Faces, or strands, that a kernel goes through at most between two questions.
constexpr int kMostBetween = 4096;
constexpr int kNever = 1 << 30;

template <class T>
Nexil::Array<T> one(T const& value)
{
    Nexil::Array<T> array;
    array.push_back(value);
    return array;
}

/// Outputs that no algorithm gives, by which one that was touched is known.
struct Outputs {
    Nexil::Array<float3> vectors = one(float3{7, 7, 7});
    Nexil::Array<float> floats = one(7.0f);
    Nexil::Array<float> moreFloats = one(7.0f);
    Nexil::Array<Geometry::Mesh::FaceEdge> edges = one(Geometry::Mesh::FaceEdge{7, 7});
    Nexil::Array<Geometry::Mesh::FaceEdge> pointFaces = one(Geometry::Mesh::FaceEdge{7, 7});
    Nexil::Array<unsigned int> indices = one(7u);
    unsigned int count = 7;

    bool operator==(Outputs const&) const = default;
};

struct Case {
    char const* name;
    std::function<void(Outputs&)> run;
};

std::vector<Case> cases(Object const& mesh, Object const& strands)
{
    std::vector<Case> all{
        {"face normals", [&](Outputs& out) { computeMeshFaceNormals(mesh, out.vectors); }},
        {"normals topology",
         [&](Outputs& out) { computeMeshNormalsTopology(mesh, {}, 0.5f, out.indices, out.count, nullptr); }},
        {"adjacency",
         [&](Outputs& out) { (void)buildFaceVertexAdjacency(mesh, out.edges, out.pointFaces, out.indices, nullptr); }},
        {"Euler", [&](Outputs&) { (void)Geometry::Mesh::eulerCharacteristic(mesh); }},
        {"components", [&](Outputs&) { (void)Geometry::Mesh::connectedComponents(mesh); }},
        {"Betti", [&](Outputs&) { (void)Geometry::Mesh::bettiNumbers(mesh); }},
        {"diagnose", [&](Outputs&) { (void)Geometry::Mesh::diagnose(mesh); }},
        {"points to faces",
         [&](Outputs&) {
             bool isFine = false;
             (void)Geometry::pointsToFaces(mesh, Nexil::Array<bool>{true}, Geometry::TagConversionStyle::AllElements,
                                           &isFine);
         }},
        {"tangents", [&](Outputs& out) { (void)computeStrandTangents(strands, out.vectors, nullptr); }},
        {"lengths", [&](Outputs& out) { (void)computeStrandLength(strands, out.floats, out.moreFloats, nullptr); }},
        {"ratios", [&](Outputs& out) { (void)computeStrandRatio(strands, out.floats, nullptr); }}};
    for (bool const byAngle : {false, true})
        for (bool const byArea : {false, true})
            all.push_back({byAngle  ? byArea ? "vertex normals, both" : "vertex normals, angle"
                           : byArea ? "vertex normals, area"
                                    : "vertex normals",
                           [&mesh, byAngle, byArea](Outputs& out) {
                               computeMeshVertexNormals(mesh, byAngle, byArea, out.vectors);
                           }});
    return all;
}

TEST(Cancellation, IsAskedForOnceAChunkAndLeavesOutputsUntouched)
{
    auto const mesh = support::meshOn(kFaces, support::torusFaces(kSide));
    auto const strands = Veldrin::createObject();
    std::vector<unsigned int> offsets(kFaces + 1);
    for (unsigned int i = 0; i <= kFaces; ++i)
        offsets[i] = 2 * i;
    Geometry::populateStrand(support::array(std::vector<float3>(2 * kFaces, float3{1, 2, 3})), support::array(offsets),
                             *strands);
    for (Case const& each : cases(*mesh, *strands))
        for (unsigned int const threadCount : {1u, 2u}) {
            SCOPED_TRACE(std::string(each.name) + " on " + std::to_string(threadCount));
            tbb::global_control const limit(tbb::global_control::max_allowed_parallelism, threadCount);
            int wholeRun = 0;
            {
                Hook const hook(kNever);
                Outputs out;
                each.run(out);
                wholeRun = questions;
            }
            EXPECT_GE(wholeRun, static_cast<int>(kFaces) / kMostBetween);
            for (int const questionCount : {0, 1, wholeRun / 2, wholeRun - 1 - static_cast<int>(threadCount)}) {
                Outputs out;
                Hook const hook(questionCount);
                EXPECT_THROW(each.run(out), std::runtime_error) << questionCount << " of " << wholeRun;
                EXPECT_EQ(out, Outputs()) << questionCount;
                EXPECT_LE(questions, wholeRun);
            }
        }
}

} // namespace
