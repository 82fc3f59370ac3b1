#include <nexil/SerializationData.h>

#include <gmock/gmock.h>

namespace {

using Nexil::CompositeSerializationData;
using Nexil::SequenceSerializationData;
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

TEST(SerializationData, CopiesAreDeepAndAWalkerMayReplaceWhatItStandsOn)
{
    SerializationData tree = 1.5;
    for (unsigned int depth = 0; depth < 12; ++depth) {
        SequenceSerializationData list;
        list.push_back(tree);
        CompositeSerializationData level;
        level["list"] = std::move(list);
        level["down"] = std::move(tree);
        tree = std::move(level);
    }
    for (SerializationData copy = tree; tree.asComposite(); copy = tree) {
        EXPECT_TRUE(tree.asComposite()->find("list")->asSequence()->begin()[0] == *copy.asComposite()->find("down"));
        ASSERT_TRUE(tree.asComposite()->get("down", tree));
    }
    EXPECT_TRUE(tree == SerializationData(1.5));
}

} // namespace
