#include <support/Geometry.h>
#include <veldrin/geometry/Prototypes.h>

#include <gtest/gtest.h>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;

using ObjectPtr = Nexil::Ptr<Object>;

struct {
    void (*populate)(Object&);
    ObjectPtr (*prototype)();
} const kKinds[] = {
    {&populateVolume, &getVolumePrototype},
    {&populateInstances, &getInstancesPrototype},
    {&populateMesh, &getMeshPrototype},
    {&populateStrand, &getStrandPrototype},
    {&populatePointCloud, &getPointCloudPrototype},
    {&populateLevelSet, &getLevelSetPrototype},
    {&populateFogVolume, &getFogVolumePrototype},
};

TEST(Prototypes, EachKindIsToldFromTheOthers)
{
    // Rows: volume, instances, mesh, strand, point cloud, level set, fog volume. What has points is a point cloud too.
    char const* const isKind[] = {"1000000", "0100000", "0010100", "0001100", "0000100", "1000010", "1000001"};
    for (std::size_t i = 0; i < std::size(kKinds); ++i) {
        auto const object = support::filled(kKinds[i].populate);
        setProperty(*object, "anything", 1);
        setProperty(*object, "more", ObjectPtr());
        std::string row;
        for (auto const& kind : kKinds)
            row += Object::isA(*object, *kind.prototype()) ? '1' : '0';
        EXPECT_EQ(row, isKind[i]) << i;
    }
    auto const types = getGeometryTypes();
    ASSERT_EQ(types->size(), 5u);
    for (std::size_t i = 0; i < 5; ++i)
        EXPECT_EQ((*types)[i], kKinds[i].prototype()) << i;
}

TEST(Prototypes, DataIsAskedForByName)
{
    auto const generic = getDataGeoPropPrototype(sGenericDataGeoProp);
    EXPECT_NE(getDataGeoPropPrototype(""), generic);
    EXPECT_TRUE(Object::isA(*getDataGeoPropPrototype(""), *generic));
    EXPECT_TRUE(Object::isA(*generic, *getDataGeoPropPrototype("")));
    // Components and ranges of the prototypes are no data.
    for (char const* name : {"no_such_property", sPointComp, sVoxelTileTree, sVoxelSignedDistance, sCount})
        EXPECT_EQ(getDataGeoPropPrototype(name), generic) << name;
    EXPECT_EQ(getDataGeoPropPrototype(sPointPosition), support::part(*getMeshPrototype(), sPointPosition));
    EXPECT_EQ(getDataGeoPropPrototype(sStrandOffset), support::part(*getStrandPrototype(), sStrandOffset));
    EXPECT_EQ(getDataGeoPropPrototype(sInstanceShape), support::part(*getInstancesPrototype(), sInstanceShape));
}

TEST(Prototypes, ClearedOnesAreBuiltAnewAndThoseOfCallersStay)
{
    auto const before = getMeshPrototype();
    EXPECT_EQ(getMeshPrototype(), before);
    clearGeometryPrototypes();
    EXPECT_NE(getMeshPrototype(), before);
    EXPECT_EQ(support::dump(*getMeshPrototype()), support::dump(*before));
}

} // namespace
