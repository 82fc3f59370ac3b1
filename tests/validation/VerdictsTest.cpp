#include "Edits.h"

#include <veldrin/geometry/Prototypes.h>
#include <veldrin/validation/MeshValidator.h>
#include <veldrin/validation/PointCloudValidator.h>
#include <veldrin/validation/StrandValidator.h>
#include <veldrin/validation/VolumeValidator.h>

#include <gtest/gtest.h>

#include <functional>
#include <memory>

namespace {

using namespace Veldrin;
using namespace support;
using Code = Geometry::GeoValidator::ErrorCode;

enum class Kind { Any, Mesh, PointCloud, Strand, Volume };

std::unique_ptr<Geometry::GeoValidator> validatorOf(Kind kind)
{
    switch (kind) {
    case Kind::Mesh: return std::make_unique<Geometry::MeshValidator>();
    case Kind::PointCloud: return std::make_unique<Geometry::PointCloudValidator>();
    case Kind::Strand: return std::make_unique<Geometry::StrandValidator>();
    case Kind::Volume: return std::make_unique<Geometry::VolumeValidator>();
    default: return std::make_unique<Geometry::GeoValidator>();
    }
}

/// Two triangles over four points: 6 corners.
Nexil::MutablePtr<Object> twoTriangles()
{
    return support::mesh({{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {1, 1, 0}}, {{0, 1, 2}, {2, 1, 3}});
}

Change indices(char const* name, Indices const& values)
{
    return [=](Object& o) { setIndices(o, name, values); };
}

Change noIndices(char const* name)
{
    return [=](Object& o) { setField(o, name, "data", Nexil::Ptr<Nexil::Array<unsigned int>>()); };
}

/// What the populate function makes in its place.
Change nowOf(Change const& populate)
{
    return [=](Object& o) {
        o.eraseAllProperties();
        populate(o);
    };
}

Change noFaces(Indices const& offsets)
{
    return nowOf([=](Object& o) {
        Geometry::populateMesh(o);
        setIndices(o, "face_offset", offsets);
    });
}

/// Data over component "c" of three elements.
Change data(char const* name, char const* target, std::vector<float> const& values)
{
    return [=](Object& o) {
        addComponent(o, "c", 3);
        addData(o, name, target, values);
    };
}

/// A range beside the same; with a null pointer where no indices are handed in.
Change range(char const* name, char const* target, Nexil::Ptr<Nexil::Array<unsigned int>> const& values)
{
    return [=](Object& o) {
        addComponent(o, "c", 3);
        addRange(o, name, target, {});
        setField(o, name, "indices", values);
    };
}

/// The shape of data shared out over the same by a range.
Change sharedOut(std::vector<float> const& values, Indices const& of)
{
    return [=](Object& o) {
        addComponent(o, "c", 3);
        addRange(o, "d_index", "c", of);
        addData(o, "d", "d_index", values);
    };
}

struct Case {
    char const* what;
    Kind kind;
    /// Breaks a valid object of the kind; an empty one for Kind::Any.
    Change change;
    Code code = Code::Success;
    char const* message = "";
};

Nexil::MutablePtr<Object> validObject(Kind kind)
{
    auto const positions = array<Math::float3>({{}, {}, {}, {}});
    switch (kind) {
    case Kind::Mesh: return twoTriangles();
    case Kind::PointCloud: return filled([&](Object& cloud) { Geometry::populatePointCloud(positions, cloud); });
    case Kind::Strand:
        return filled([&](Object& strand) {
            Geometry::populateStrand(positions, array<unsigned int>({0, 2, 4}), strand);
        });
    case Kind::Volume: return filled(&Geometry::populateVolume);
    default: return createObject();
    }
}

Case const kCases[] = {
    {"a mesh", Kind::Mesh, [](Object&) {}},
    {"a mesh of nothing", Kind::Mesh, nowOf(static_cast<void (*)(Object&)>(&Geometry::populateMesh))},
    {"a cube", Kind::Mesh, nowOf([](Object& o) { Geometry::populateCubeMesh(2, o); })},
    {"a sphere", Kind::Mesh, nowOf([](Object& o) { Geometry::populateSphereMesh(-1, o); })},
    {"no mesh at all", Kind::Mesh, nowOf([](Object&) {}), Code::InvalidObject, "Object is not a valid mesh"},
    {"a null array of positions", Kind::Mesh,
     [](Object& o) { setField(o, "point_position", "data", Nexil::Ptr<Nexil::Array<Math::float3>>()); },
     Code::InvalidProperty, "point_position contains an invalid property data"},
    {"more points than positions", Kind::Mesh, count("point_component", 5), Code::InvalidElementCount,
     "point_position has an invalid number of elements"},
    {"a null array of corners", Kind::Mesh, noIndices("face_vertex"), Code::InvalidProperty,
     "face_vertex contains an invalid property data"},
    {"a corner behind the last point", Kind::Mesh, indices("face_vertex", {0, 1, 4, 2, 1, 3}), Code::InvalidIndex,
     "face_vertex contains an invalid index into point_component"},
    {"fewer corners than counted, found by the check of all properties", Kind::Mesh,
     indices("face_vertex", {0, 1, 2, 2, 1}), Code::InvalidElementCount,
     "face_vertex has an invalid number of elements"},
    {"a null array of offsets", Kind::Mesh, noIndices("face_offset"), Code::InvalidProperty,
     "face_offset contains an invalid property data"},
    {"a first offset above 0", Kind::Mesh, indices("face_offset", {1, 3, 6}), Code::InvalidIndex,
     "face_offset contains an invalid index into face_component"},
    {"offsets that target nothing, thus no face", Kind::Mesh, [](Object& o) { setTarget(o, "face_offset", "nowhere"); },
     Code::InvalidIndex, "face_offset contains an invalid index into nowhere"},
    {"no faces and the offset 0", Kind::Mesh, noFaces({0})},
    {"no faces and no offset", Kind::Mesh, noFaces({}), Code::InvalidIndex,
     "face_offset contains an invalid index into face_component"},

    {"points", Kind::PointCloud, [](Object&) {}},
    {"no points", Kind::PointCloud, nowOf(static_cast<void (*)(Object&)>(&Geometry::populatePointCloud))},
    {"no points at all", Kind::PointCloud, without("point_component"), Code::InvalidObject,
     "Object is not a valid point cloud"},
    {"fewer positions than points", Kind::PointCloud, count("point_component", 5), Code::InvalidElementCount,
     "point_position has an invalid number of elements"},

    {"strands", Kind::Strand, [](Object&) {}},
    {"no strands", Kind::Strand, nowOf(static_cast<void (*)(Object&)>(&Geometry::populateStrand))},
    {"no strands at all", Kind::Strand, without("strand_offset"), Code::InvalidObject, "Object is not a valid strand"},
    {"no offsets of strands", Kind::Strand, noIndices("strand_offset"), Code::InvalidProperty,
     "strand_offset contains an invalid property data"},
    {"a strand beyond the points", Kind::Strand, indices("strand_offset", {0, 2, 5}), Code::InvalidIndex,
     "strand_offset contains an invalid index into strand_component"},

    {"a volume", Kind::Volume, [](Object&) {}},
    {"a level set", Kind::Volume, nowOf(&Geometry::populateLevelSet)},
    {"a fog volume", Kind::Volume, nowOf(&Geometry::populateFogVolume)},
    {"no volume at all", Kind::Volume, nowOf([](Object&) {}), Code::InvalidObject, "Object is not a valid volume"},
    {"a volume whose voxels are claimed by numbers alone", Kind::Volume, count("voxel_component", 1),
     Code::InvalidObject, "Object is not a valid volume"},

    {"plain values, components and further objects", Kind::Any,
     [](Object& o) {
         setProperty(o, "name", "value");
         setProperty(o, "null", Nexil::Ptr<Object>());
         setProperty(o, "further", createObject());
         addComponent(o, "c", 3);
     }},
    {"data that targets nothing", Kind::Any, data("d", "", {1}), Code::MissingTarget, "d has no target"},
    {"data that targets itself", Kind::Any, data("d", "d", {1}), Code::InvalidTarget, "d target itself"},
    {"a null array over a component", Kind::Any,
     [](Object& o) {
         data("d", "c", {})(o);
         setField(o, "d", "data", Nexil::Ptr<Nexil::Array<float>>());
     },
     Code::InvalidElementCount, "d has an invalid number of elements"},
    {"data that targets data", Kind::Any,
     [](Object& o) {
         data("e", "c", {1, 2, 3})(o);
         data("d", "e", {1})(o);
     },
     Code::InvalidTarget, "d has an invalid target e"},
    {"data over a range that asks for some values, for none last", Kind::Any, sharedOut({5, 6}, {1, 0, kInvalidIndex})},
    {"a last index that tells the number of values", Kind::Any, sharedOut({5, 6}, {0, 1, 1, 2})},
    {"an index behind the number of values", Kind::Any, sharedOut({5, 6}, {2, 0, 1}), Code::InvalidIndex,
     "d_index contains an invalid index into d"},
    {"a last index behind the number of values", Kind::Any, sharedOut({5, 6}, {0, 1, 1, 3}), Code::InvalidIndex,
     "d_index contains an invalid index into d"},
    {"a range that is told first, though the data over it fails as well", Kind::Any, sharedOut({5, 6}, {0, 9}),
     Code::InvalidElementCount, "indices has an invalid number of elements"},
    {"data over a range without indices", Kind::Any,
     [](Object& o) {
         addData(o, "d", "r", {1});
         range("r", "c", nullptr)(o);
     },
     Code::InvalidTarget, "d has an invalid target r"},
    {"a range that targets nothing", Kind::Any, range("r", "e", array(Indices{})), Code::MissingTarget,
     "r has no target"},
    {"a range that targets itself, its indices being null", Kind::Any, range("r", "r", nullptr), Code::InvalidTarget,
     "r target itself"},
    {"a range that targets a range", Kind::Any,
     [](Object& o) {
         range("q", "c", array(Indices{0, 0, 0}))(o);
         range("r", "q", array(Indices{}))(o);
     },
     Code::InvalidTarget, "r has an invalid target q"},
};

TEST(Verdicts, EachFaultHasItsCodeAndMessage)
{
    for (Case const& c : kCases) {
        auto const object = validObject(c.kind);
        c.change(*object);
        auto const before = support::dump(*object);
        auto const status = validatorOf(c.kind)->validate(*object);
        EXPECT_EQ(static_cast<unsigned>(status.code), static_cast<unsigned>(c.code))
            << c.what << ": " << status.message;
        EXPECT_EQ(status.message.view(), c.message) << c.what;
        EXPECT_EQ(static_cast<bool>(status), c.code == Code::Success) << c.what;
        EXPECT_EQ(support::dump(*object), before) << c.what;
    }
}

TEST(Verdicts, AreTheSameWhereverInALargeMeshAFaultLiesOnEveryNumberOfThreads)
{
    constexpr unsigned int kFaceCount = 100000;
    Polygons faces;
    for (unsigned int f = 0; f < kFaceCount; ++f)
        faces.push_back({f, f + 1, f + 2});
    auto const mesh = support::mesh(std::vector<Math::float3>(kFaceCount + 2), faces);
    auto const expectVerdict = [&](char const* name, unsigned int place, unsigned int value, char const* expected) {
        auto values = valuesIn<unsigned int>(*mesh, name);
        values[place] = value;
        auto const changed = Nexil::makeMutable<Object>(*mesh);
        setIndices(*changed, name, values);
        onThreadCounts([&] {
            EXPECT_EQ(Geometry::validateMesh(*changed).message, expected) << name << ' ' << place << ' ' << value;
        });
    };
    unsigned int const pointCount = kFaceCount + 2;
    for (unsigned int const corner : {0u, kFaceCount, 3 * kFaceCount - 1}) {
        expectVerdict("face_vertex", corner, pointCount - 1, "");
        for (unsigned int const value : {pointCount, kInvalidIndex})
            expectVerdict("face_vertex", corner, value, "face_vertex contains an invalid index into point_component");
    }
    for (unsigned int const face : {1u, kFaceCount / 2, kFaceCount}) {
        unsigned int const next = std::min(3 * face + 3, 3 * kFaceCount);
        expectVerdict("face_offset", face, 3 * face - 3, "");
        expectVerdict("face_offset", face, next, "");
        expectVerdict("face_offset", face, next + 1, "face_offset contains an invalid index into face_component");
    }
    expectVerdict("face_offset", kFaceCount / 2, 3 * (kFaceCount / 2) - 4,
                  "face_offset contains an invalid index into face_component");
}

TEST(Verdicts, OfSeveralFailuresTheFirstKeyIsTold)
{
    auto const object = createObject();
    addComponent(*object, "c", 2);
    // Far more keys than one thread takes at once; the first to fail needs its indices read, later ones do not.
    for (int i = 0; i < 3000; ++i)
        addData(*object, ("good" + std::to_string(i)).c_str(), "c", {1, 2});
    addRange(*object, "range", "c", {0, 5});
    addData(*object, "first", "range", {1});
    for (int i = 0; i < 3000; ++i)
        addData(*object, ("bad" + std::to_string(i)).c_str(), "c", {1});
    onThreadCounts(
        [&] { EXPECT_EQ(verdict(Geometry::GeoValidator(), *object), "range contains an invalid index into first"); });
    object->eraseProperty("first");
    onThreadCounts([&] {
        EXPECT_EQ(verdict(Geometry::GeoValidator(), *object), "bad0 has an invalid number of elements");
        EXPECT_EQ(Geometry::GeoValidator().findFailures(*object).size(), 3000u);
    });
}

TEST(Verdicts, AllFailuresNameEachBrokenPropertyOnce)
{
    auto const object = twoTriangles();
    setField(*object, "point_component", "count", 5u);
    setIndices(*object, "face_vertex", {0, 1, 9, 2});
    setIndices(*object, "face_offset", {0, 9, 6});
    addData(*object, "point_mass", "nowhere", {1});
    addData(*object, "point_width", "point_component", {1, 2, 3, 4, 5});
    std::string found;
    for (auto const& failure : Geometry::MeshValidator().findFailures(*object))
        found += std::string(failure.property.view()) + ": " + failure.status.message.c_str() + "\n";
    EXPECT_EQ(found, "point_position: point_position has an invalid number of elements\n"
                     "face_vertex: face_vertex contains an invalid index into point_component\n"
                     "face_offset: face_offset contains an invalid index into face_component\n"
                     "point_mass: point_mass has no target\n");
    EXPECT_TRUE(Geometry::MeshValidator().findFailures(*twoTriangles()).empty());
}

} // namespace
