#include <vld/Channel.h>
#include <vld/Container.h>
#include <vld/Grid.h>
#include <vld/Object.h>

#include <gtest/gtest.h>

namespace {

using namespace VLD::TileTree3D;
using FloatArray = Nexil::Array<float>;

Nexil::Ptr<Channel<SmallTiles>> channel(char const* name)
{
    return Nexil::makePtr<Channel<SmallTiles>>(name, "tiles", Nexil::makePtr<FloatArray>(FloatArray{1, 2, 3}), 0.0f);
}

TEST(VolumeObject, FindsComponentsByNameAndKind)
{
    auto volume = VLD::createObject();
    auto const first = channel("b");
    EXPECT_TRUE(volume->addComponent(first));
    EXPECT_TRUE(volume->addComponent(channel("a")));
    EXPECT_FALSE(volume->addComponent(channel("b")));
    EXPECT_FALSE(volume->addComponent(channel("")));
    EXPECT_FALSE(volume->addComponent(nullptr));

    EXPECT_EQ(volume->componentRange(), (Nexil::Array<Nexil::String>{"b", "a"}));
    EXPECT_EQ(volume->component<Channel<SmallTiles>>("b"), first);
    EXPECT_EQ(volume->component<ChannelBase>("b").get(), static_cast<ChannelBase const*>(first.get()));
    EXPECT_EQ(volume->component<Channel<WideTiles>>("b"), nullptr);
    EXPECT_EQ(volume->component<ChannelBase>("c"), nullptr);
    EXPECT_TRUE(volume->hasComponentFromName("a"));

    Grid<SmallTiles> const grid{Nexil::makePtr<VoxelTopology<SmallTiles>>("t", TileLevels()),
                                Nexil::makePtr<Container<SmallTiles>>("a", nullptr, 1.0f), channel("c")};
    EXPECT_FALSE(grid.addTo(*volume)) << "one of its names is taken";
    EXPECT_EQ(volume->componentCount(), 2u);

    volume->clear();
    EXPECT_TRUE(volume->empty());
    EXPECT_TRUE(volume->addComponent(first));
}

TEST(VolumeObject, AChannelCopiesItsValuesBeforeTheyAreWrittenWhenOthersHoldThem)
{
    auto values = Nexil::makePtr<FloatArray>(FloatArray{1, 2, 3});
    Channel<SmallTiles> c("c", "tiles", values, 5.0f);
    EXPECT_EQ(c.values<double>(), nullptr);
    EXPECT_TRUE(c.writeValues<int>().empty());
    c.writeValues<float>()[1] = 7;
    EXPECT_EQ(*values, (FloatArray{1, 2, 3}));
    EXPECT_EQ(*c.values<float>(), (FloatArray{1, 7, 3}));
    auto const* const own = c.values<float>().get();
    c.writeValues<float>()[1] = 8;
    EXPECT_EQ(c.values<float>().get(), own) << "nobody else holds them";

    Channel<SmallTiles> empty("c", "tiles", Nexil::Ptr<FloatArray>(), 0);
    EXPECT_TRUE(empty.setData(Nexil::Ptr<FloatArray>()));
    EXPECT_NE(empty.values<float>(), nullptr);
}

} // namespace
