#include "Edits.h"

#include <veldrin/validation/MeshValidator.h>

#include <gtest/gtest.h>

#include <map>
#include <random>

namespace {

using namespace Veldrin;
using namespace support;

/// A mesh as plain numbers, and the rules once more, one element after the other. Shares nothing with the library.
struct PlainMesh {
    struct Property {
        std::string name;
        std::string target;
        std::size_t size;
        /// Of a range; data has none.
        std::vector<unsigned int> indices;
        bool isRange = false;
    };

    unsigned int points = 0, corners = 0, faces = 0;
    std::size_t positions = 0;
    std::vector<unsigned int> faceVertex, faceOffset;
    /// Beside the three of every mesh, in their order.
    std::vector<Property> further;

    [[nodiscard]] long count(std::string const& name) const
    {
        std::map<std::string, long> const counts{
            {"point_component", points}, {"face_vertex_component", corners}, {"face_component", faces}};
        auto const place = counts.find(name);
        return place == counts.end() ? -1 : place->second;
    }

    [[nodiscard]] std::string judge() const
    {
        if (positions < points)
            return "point_position has an invalid number of elements";
        for (unsigned int const v : faceVertex)
            if (!(v < points))
                return "face_vertex contains an invalid index into point_component";
        bool areOffsets = faceOffset.size() == std::size_t(faces) + 1 && faceOffset.front() == 0;
        for (std::size_t i = 0; areOffsets && i < faceOffset.size(); ++i)
            areOffsets = faceOffset[i] <= corners && (i + 1 == faceOffset.size() || faceOffset[i] <= faceOffset[i + 1]);
        if (!areOffsets)
            return "face_offset contains an invalid index into face_component";
        if (faceVertex.size() < corners)
            return "face_vertex has an invalid number of elements";
        for (Property const& p : further)
            if (auto message = p.isRange ? judgeRange(p) : judgeData(p); !message.empty())
                return message;
        return "";
    }

    [[nodiscard]] std::string judgeRange(Property const& p) const
    {
        if (p.target == p.name)
            return p.name + " target itself";
        if (count(p.target) < 0)
            return p.name + " has no target";
        return static_cast<long>(p.indices.size()) < count(p.target) ? "indices has an invalid number of elements" : "";
    }

    [[nodiscard]] std::string judgeData(Property const& p) const
    {
        if (p.target == p.name)
            return p.name + " target itself";
        if (count(p.target) >= 0)
            return static_cast<long>(p.size) < count(p.target) ? p.name + " has an invalid number of elements" : "";
        for (Property const& range : further) {
            if (range.name != p.target)
                continue;
            auto indices = range.indices;
            if (static_cast<long>(indices.size()) == count(range.target) + 1 && indices.back() == p.size)
                indices.pop_back();
            for (unsigned int const v : indices)
                if (v != 0xFFFFFFFFu && v >= p.size)
                    return range.name + " contains an invalid index into " + p.name;
            return "";
        }
        return p.name + " has no target";
    }

    [[nodiscard]] Nexil::MutablePtr<Object> build() const
    {
        auto made = createObject();
        Geometry::populateMesh(*made);
        setField(*made, "point_component", "count", points);
        setField(*made, "face_vertex_component", "count", corners);
        setField(*made, "face_component", "count", faces);
        setField(*made, "point_position", "data", array(std::vector<Math::float3>(positions)));
        setIndices(*made, "face_vertex", faceVertex);
        setIndices(*made, "face_offset", faceOffset);
        for (Property const& p : further)
            if (p.isRange)
                addRange(*made, p.name.c_str(), p.target.c_str(), p.indices);
            else
                addData(*made, p.name.c_str(), p.target.c_str(), std::vector<float>(p.size));
        return made;
    }
};

using Random = std::mt19937;

unsigned int below(Random& random, std::size_t end)
{
    return static_cast<unsigned int>(std::uniform_int_distribution<std::size_t>(0, end - 1)(random));
}

PlainMesh validMesh(Random& random, unsigned int faces)
{
    PlainMesh made;
    made.faces = faces;
    made.points = 3 + below(random, 2 * faces + 1);
    made.positions = made.points + below(random, 2);
    made.faceOffset.push_back(0);
    for (unsigned int f = 0; f < faces; ++f)
        made.faceOffset.push_back(made.faceOffset.back() + below(random, 6));
    made.corners = made.faceOffset.back() + below(random, 2);
    for (unsigned int c = 0; c < made.corners; ++c)
        made.faceVertex.push_back(below(random, made.points));
    made.further.push_back({"face_weight", "face_component", made.faces + below(random, 2), {}});
    PlainMesh::Property range{"uv_index", "face_vertex_component", 0, {}, true};
    std::size_t const values = 1 + below(random, made.corners + 1);
    for (unsigned int c = 0; c < made.corners; ++c)
        range.indices.push_back(below(random, 10) == 0 ? kInvalidIndex : below(random, values));
    if (below(random, 2) == 0)
        range.indices.push_back(static_cast<unsigned int>(values));
    made.further.push_back({"uv", "uv_index", values, {}});
    made.further.push_back(range);
    return made;
}

/// Changes one place, mostly for the worse.
void breakOne(PlainMesh& mesh, Random& random)
{
    unsigned int const landmarks[] = {0,
                                      mesh.points,
                                      mesh.corners,
                                      mesh.faces,
                                      kInvalidIndex,
                                      0x7FFFFFFFu,
                                      static_cast<unsigned int>(mesh.further[1].size)};
    // At a landmark, just below or just above; the lowest and the highest number are neighbours.
    auto const value = landmarks[below(random, std::size(landmarks))] + below(random, 3) - 1;
    char const* const targets[] = {"", "uv", "uv_index", "face_weight", "point_component", "face_vertex_component"};
    auto const change = [&](std::vector<unsigned int>& values) {
        switch (below(random, 4)) {
        case 0: values.push_back(value); break;
        case 1:
            if (values.size() > 1)
                values.pop_back();
            break;
        default:
            if (!values.empty())
                values[below(random, values.size())] = value;
        }
    };
    switch (below(random, 9)) {
    case 0: mesh.points = value; break;
    case 1: mesh.corners = value; break;
    case 2: mesh.faces = value; break;
    case 3: mesh.positions = below(random, mesh.positions + 1); break;
    case 4: change(mesh.faceVertex); break;
    case 5: change(mesh.faceOffset); break;
    case 6: mesh.further[below(random, 2)].size = below(random, mesh.corners + 2); break;
    case 7: change(mesh.further[2].indices); break;
    default: mesh.further[below(random, 2)].target = targets[below(random, std::size(targets))];
    }
}

/// Data over data and a range as data's last resort are told by the table of verdicts alone.
bool isInOraclesReach(PlainMesh const& mesh)
{
    return mesh.further[0].target != "uv" && mesh.further[1].target != "face_weight";
}

TEST(GeneratedMeshes, AreJudgedLikeTheRulesSay)
{
    Random random(6);
    std::map<std::string, int> met;
    for (int round = 0; round < 6000; ++round) {
        auto mesh = validMesh(random, 1 + below(random, 12));
        ASSERT_EQ(mesh.judge(), "");
        if (round % 10 != 0)
            breakOne(mesh, random);
        if (!isInOraclesReach(mesh))
            continue;
        auto const verdict = mesh.judge();
        ++met[verdict];
        ASSERT_EQ(Geometry::validateMesh(*mesh.build()).message.view(), verdict) << "round " << round;
    }
    // Not a generator that only ever breaks one thing.
    EXPECT_GE(met.size(), 10u);
}

TEST(GeneratedMeshes, LargeOnesAreJudgedAlikeOnEveryNumberOfThreadsWhereverTheFaultLies)
{
    Random random(7);
    PlainMesh const whole = validMesh(random, 100000);
    auto const expectVerdict = [](PlainMesh const& mesh) {
        auto const verdict = mesh.judge();
        auto const object = mesh.build();
        onThreadCounts([&] { EXPECT_EQ(Geometry::validateMesh(*object).message.view(), verdict); });
    };
    for (unsigned int const corner : {0u, whole.corners / 2, whole.corners - 1})
        for (unsigned int const value : {whole.points - 1, whole.points, kInvalidIndex}) {
            auto mesh = whole;
            mesh.faceVertex[corner] = value;
            expectVerdict(mesh);
        }
    for (unsigned int const face : {1u, whole.faces / 2, whole.faces}) {
        unsigned int const before = whole.faceOffset[face - 1];
        unsigned int const behind = whole.faceOffset[std::min(face + 1, whole.faces)];
        for (unsigned int const value : {before - 1, before, behind, behind + 1, whole.corners + 1}) {
            auto mesh = whole;
            mesh.faceOffset[face] = value;
            expectVerdict(mesh);
        }
    }
}

} // namespace
