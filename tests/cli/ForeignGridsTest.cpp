#include <openvdb/io/Stream.h>
#include <openvdb/openvdb.h>

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <random>

// Files that OpenVDB wrote by itself, and reads again after the program had them.
namespace {

using openvdb::Coord;
using openvdb::CoordBBox;

constexpr int kFar = 1 << 30;
Coord const kCentres[] = {{0, 0, 0}, {-kFar, kFar, -kFar}, {kFar, -kFar, 77}};

/// Voxels all over space, regions of one value, and states that do not follow from the values.
template <class Grid, class Draw>
typename Grid::Ptr scattered(char const* name, typename Grid::ValueType const& background, Draw const& draw)
{
    std::mt19937 random(5);
    auto value = [&] { return typename Grid::ValueType(draw(static_cast<int>(random() % 99) - 20)); };
    auto offset = [&] { return static_cast<int>(random() % 40) - 20; };
    auto grid = Grid::create(background);
    grid->setName(name);
    auto accessor = grid->getAccessor();
    for (Coord const& centre : kCentres)
        for (int i = 0; i < 300; ++i)
            accessor.setValueOn(centre.offsetBy(offset(), offset(), offset()), value());
    grid->fill(CoordBBox(-16, -40, 8, 15, -9, 23), value(), true);
    grid->fill(CoordBBox(24, 24, 24, 31, 31, 31), value(), false);
    accessor.setValueOn({3, 3, 40}, background);
    accessor.setValueOff({4, 3, 40}, value());
    return grid;
}

template <class Grid>
void expectSame(openvdb::GridBase::Ptr const& readBack, Grid const& grid)
{
    SCOPED_TRACE(grid.getName());
    auto const back = openvdb::gridPtrCast<Grid>(readBack);
    ASSERT_TRUE(back);
    EXPECT_EQ(back->background(), grid.background());
    EXPECT_EQ(back->activeVoxelCount(), grid.activeVoxelCount());
    EXPECT_TRUE(back->transform().indexToWorld(Coord(7, -3, 9)).eq(grid.transform().indexToWorld(Coord(7, -3, 9))));
    auto expected = grid.getConstAccessor(), found = back->getConstAccessor();
    std::uint64_t differences = 0;
    for (Coord const& centre : kCentres)
        for (Coord const& voxel : CoordBBox::createCube(centre.offsetBy(-42), 84)) {
            typename Grid::ValueType a, b;
            bool const isSameState = expected.probeValue(voxel, a) == found.probeValue(voxel, b);
            differences += !isSameState || a != b;
        }
    EXPECT_EQ(differences, 0u);
}

TEST(ForeignGrids, ComeBackWithTheSameValuesAndStates)
{
    openvdb::initialize();
    auto const floats = scattered<openvdb::FloatGrid>("heat", 0.25f, [](int i) { return float(i) / 8; });
    auto const doubles = scattered<openvdb::DoubleGrid>("mass", -1.0, [](int i) { return i / 3.0; });
    auto const integers = scattered<openvdb::Int32Grid>("ids", 5, [](int i) { return i * 20000000; });
    auto const flags = scattered<openvdb::BoolGrid>("component", false, [](int i) { return i % 2 == 0; });
    auto const vectors = scattered<openvdb::Vec3SGrid>("wind", openvdb::Vec3s(0, 0, 1),
                                                       [](int i) { return openvdb::Vec3s(float(i) / 2, 1, -2.5f); });
    vectors->setTransform(openvdb::math::Transform::createLinearTransform(0.1));
    vectors->transform().postTranslate({1.5, -2.25, 1e-3});
    using Unusual = openvdb::Grid<openvdb::tree::Tree4<float, 4, 3, 2>::Type>;
    auto const unusual = scattered<Unusual>("odd", 0, [](int i) { return i; });
    std::string const folder = ::testing::TempDir() + "foreign_grids.";
    openvdb::io::File(folder + "a.vdb").write(openvdb::GridCPtrVec{unusual, floats, doubles, integers, flags, vectors});

    auto zon = [&](std::string const& arguments) {
        EXPECT_EQ(std::system((VELDRIN_ZON " " + arguments + " 2> " + folder + "said").c_str()), 0) << arguments;
        std::ifstream said(folder + "said");
        return std::string(std::istreambuf_iterator<char>(said), {});
    };
    auto const said = zon("import " + folder + "a.vdb " + folder + "a.zon");
    EXPECT_NE(said.find("grid 'wind': its translation, but as vdb_transform"), said.npos) << said;
    EXPECT_NE(said.find("grid 'odd': it is a grid of type Tree_float_4_3_2"), said.npos) << said;
    zon("export " + folder + "a.zon " + folder + "b.vdb");

    openvdb::io::File back(folder + "b.vdb");
    back.open(false);
    expectSame(back.readGrid("heat"), *floats);
    expectSame(back.readGrid("mass"), *doubles);
    expectSame(back.readGrid("ids"), *integers);
    expectSame(back.readGrid("component"), *flags);
    expectSame(back.readGrid("wind"), *vectors);
    EXPECT_FALSE(back.hasGrid("odd"));

    // Without offsets of grids, no grid can be left out.
    std::ofstream stream(folder + "b.vdb", std::ios::binary);
    openvdb::io::Stream(stream).write(openvdb::GridCPtrVec{unusual});
    stream.close();
    std::string const refused = "import " + folder + "b.vdb " + folder + "b.zon";
    EXPECT_EQ(std::system((VELDRIN_ZON " " + refused).c_str()), 2 << 8);
    for (char const* const name : {"a.vdb", "a.zon", "b.vdb", "said"})
        std::remove((folder + name).c_str());
}

} // namespace
