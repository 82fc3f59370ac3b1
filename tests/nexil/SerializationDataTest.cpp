#include <nexil/SerializationData.h>

#include <gmock/gmock.h>

namespace {

using Nexil::CompositeSerializationData;
using Nexil::SerializationData;

TEST(SerializationData, CompositesKeepTheOrderOfTheirNames)
{
    CompositeSerializationData composite;
    for (char const* name : {"z", "b", "a", "b", "c", "z"})
        composite[name] = static_cast<unsigned int>(composite.size());
    std::string names;
    for (std::size_t i = 0; i < composite.size(); ++i)
        names += composite.nameAt(i).c_str();
    EXPECT_EQ(names, "zbac");
    EXPECT_TRUE(composite.childAt(1) == SerializationData(3u));
    EXPECT_FALSE(composite.childAt(1) == SerializationData(3.0));
    SerializationData child = 7u;
    EXPECT_FALSE(composite.get("missing", child));
    EXPECT_TRUE(child == SerializationData(7u));
    EXPECT_TRUE(composite.get("z", child));
    EXPECT_TRUE(child == SerializationData(4u));
}

TEST(SerializationData, AWalkerMayReplaceWhatItStandsOn)
{
    SerializationData tree = 1.5;
    for (int depth = 0; depth < 12; ++depth) {
        CompositeSerializationData level;
        level["down"] = tree;
        tree = std::move(level);
    }
    while (tree.asComposite())
        ASSERT_TRUE(tree.asComposite()->get("down", tree));
    EXPECT_TRUE(tree == SerializationData(1.5));
}

} // namespace
