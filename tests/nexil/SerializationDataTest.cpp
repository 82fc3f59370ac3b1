#include <nexil/SerializationData.h>

#include <gmock/gmock.h>

namespace {

using Nexil::CompositeSerializationData;
using Nexil::SerializationData;

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
