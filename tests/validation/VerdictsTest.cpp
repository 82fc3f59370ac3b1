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

/// A validator and an object that it passes.
struct Kind {
    std::shared_ptr<Geometry::GeoValidator> validator;
    std::function<Nexil::MutablePtr<Object>()> valid;
};

Kind const kAny{std::make_shared<Geometry::GeoValidator>(), [] { return createObject(); }};
/// Two triangles over four points: 6 corners.
Kind const kMesh{std::make_shared<Geometry::MeshValidator>(), [] {
                     return support::mesh({{0, 0, 0}, {1, 0, 0}, {0, 1, 0}, {1, 1, 0}}, {{0, 1, 2}, {2, 1, 3}});
                 }};
Kind const kPointCloud{std::make_shared<Geometry::PointCloudValidator>(), kMesh.valid};
Kind const kStrand{std::make_shared<Geometry::StrandValidator>(), [] {
                       return strands(std::vector<Math::float3>(4), {0, 2, 4});
                   }};
Kind const kVolume{std::make_shared<Geometry::VolumeValidator>(), [] { return filled(&Geometry::populateVolume); }};

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
    Kind const& kind;
    /// Breaks its valid object.
    Change change;
    char const* message = "";
};

/// The code that belongs to a message.
Code codeOf(std::string const& message)
{
    std::pair<char const*, Code> const words[] = {{" has an invalid number of elements", Code::InvalidElementCount},
                                                  {" contains an invalid property data", Code::InvalidProperty},
                                                  {" contains an invalid index into ", Code::InvalidIndex},
                                                  {" has an invalid target ", Code::InvalidTarget},
                                                  {" target itself", Code::InvalidTarget},
                                                  {" has no target", Code::MissingTarget},
                                                  {"Object is not a valid ", Code::InvalidObject}};
    for (auto const& [part, code] : words)
        if (message.find(part) != std::string::npos)
            return code;
    return Code::Success;
}

Case const kCases[] = {
    {"a mesh", kMesh, [](Object&) {}},
    {"a mesh of nothing", kMesh, nowOf(static_cast<void (*)(Object&)>(&Geometry::populateMesh))},
    {"a cube", kMesh, nowOf([](Object& o) { Geometry::populateCubeMesh(2, o); })},
    {"a sphere", kMesh, nowOf([](Object& o) { Geometry::populateSphereMesh(-1, o); })},
    {"no mesh at all", kMesh, nowOf([](Object&) {}), "Object is not a valid mesh"},
    {"a null array of positions", kMesh,
     [](Object& o) { setField(o, "point_position", "data", Nexil::Ptr<Nexil::Array<Math::float3>>()); },
     "point_position contains an invalid property data"},
    {"more points than positions", kMesh, count("point_component", 5),
     "point_position has an invalid number of elements"},
    {"a null array of corners", kMesh, noIndices("face_vertex"), "face_vertex contains an invalid property data"},
    {"a corner behind the last point", kMesh, indices("face_vertex", {0, 1, 4, 2, 1, 3}),
     "face_vertex contains an invalid index into point_component"},
    {"fewer corners than counted, found by the check of all properties", kMesh, indices("face_vertex", {0, 1, 2, 2, 1}),
     "face_vertex has an invalid number of elements"},
    {"a null array of offsets", kMesh, noIndices("face_offset"), "face_offset contains an invalid property data"},
    {"a first offset above 0", kMesh, indices("face_offset", {1, 3, 6}),
     "face_offset contains an invalid index into face_component"},
    {"offsets that target nothing, thus no face", kMesh, [](Object& o) { setTarget(o, "face_offset", "nowhere"); },
     "face_offset contains an invalid index into nowhere"},
    {"no faces and the offset 0", kMesh, noFaces({0})},
    {"no faces and no offset", kMesh, noFaces({}), "face_offset contains an invalid index into face_component"},

    {"points", kPointCloud, [](Object&) {}},
    {"no points", kPointCloud, nowOf(static_cast<void (*)(Object&)>(&Geometry::populatePointCloud))},
    {"no points at all", kPointCloud, without("point_component"), "Object is not a valid point cloud"},
    {"fewer positions than points", kPointCloud, count("point_component", 5),
     "point_position has an invalid number of elements"},

    {"strands", kStrand, [](Object&) {}},
    {"no strands", kStrand, nowOf(static_cast<void (*)(Object&)>(&Geometry::populateStrand))},
    {"no strands at all", kStrand, without("strand_offset"), "Object is not a valid strand"},
    {"no offsets of strands", kStrand, noIndices("strand_offset"), "strand_offset contains an invalid property data"},
    {"a strand beyond the points", kStrand, indices("strand_offset", {0, 2, 5}),
     "strand_offset contains an invalid index into strand_component"},

    {"a volume", kVolume, [](Object&) {}},
    {"a level set", kVolume, nowOf(&Geometry::populateLevelSet)},
    {"a fog volume", kVolume, nowOf(&Geometry::populateFogVolume)},
    {"no volume at all", kVolume, nowOf([](Object&) {}), "Object is not a valid volume"},
    {"a volume whose voxels are claimed by numbers alone", kVolume, count("voxel_component", 1),
     "Object is not a valid volume"},

    {"plain values, components and further objects", kAny,
     [](Object& o) {
         setProperty(o, "name", "value");
         setProperty(o, "null", Nexil::Ptr<Object>());
         setProperty(o, "further", createObject());
         addComponent(o, "c", 3);
     }},
    {"data that targets nothing", kAny, data("d", "", {1}), "d has no target"},
    {"data that targets itself", kAny, data("d", "d", {1}), "d target itself"},
    {"a null array over a component", kAny,
     [](Object& o) {
         data("d", "c", {})(o);
         setField(o, "d", "data", Nexil::Ptr<Nexil::Array<float>>());
     },
     "d has an invalid number of elements"},
    {"data that targets data", kAny,
     [](Object& o) {
         data("e", "c", {1, 2, 3})(o);
         data("d", "e", {1})(o);
     },
     "d has an invalid target e"},
    {"data over a range that asks for some values, for none last", kAny, sharedOut({5, 6}, {1, 0, kInvalidIndex})},
    {"a last index that tells the number of values", kAny, sharedOut({5, 6}, {0, 1, 1, 2})},
    {"an index behind the number of values", kAny, sharedOut({5, 6}, {2, 0, 1}),
     "d_index contains an invalid index into d"},
    {"a last index behind the number of values", kAny, sharedOut({5, 6}, {0, 1, 1, 3}),
     "d_index contains an invalid index into d"},
    {"a range that is told first, though the data over it fails as well", kAny, sharedOut({5, 6}, {0, 9}),
     "indices has an invalid number of elements"},
    {"data over a range without indices", kAny,
     [](Object& o) {
         addData(o, "d", "r", {1});
         range("r", "c", nullptr)(o);
     },
     "d has an invalid target r"},
    {"a range that targets nothing", kAny, range("r", "e", array(Indices{})), "r has no target"},
    {"a range that targets itself, its indices being null", kAny, range("r", "r", nullptr), "r target itself"},
    {"a range that targets a range", kAny,
     [](Object& o) {
         range("q", "c", array(Indices{0, 0, 0}))(o);
         range("r", "q", array(Indices{}))(o);
     },
     "r has an invalid target q"},
};

TEST(Verdicts, EachFaultHasItsCodeAndMessage)
{
    for (Case const& c : kCases) {
        auto const object = c.kind.valid();
        c.change(*object);
        auto const before = support::dump(*object);
        auto const status = c.kind.validator->validate(*object);
        EXPECT_EQ(status.message.view(), c.message) << c.what;
        EXPECT_TRUE(status.code == codeOf(c.message)) << c.what;
        EXPECT_EQ(static_cast<bool>(status), status.message.empty()) << c.what;
        EXPECT_EQ(support::dump(*object), before) << c.what;
    }
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
    auto const object = kMesh.valid();
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
    EXPECT_TRUE(Geometry::MeshValidator().findFailures(*kMesh.valid()).empty());
}

} // namespace
