#include <support/FailingMemory.h>
#include <support/Geometry.h>
#include <veldrin/geometry/Prototypes.h>

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

namespace {

using namespace Veldrin;
using namespace Veldrin::Geometry;

template <class T>
Nexil::Ptr<Nexil::Array<T>> zeros(std::uint64_t count)
{
    Nexil::Array<T> array;
    array.resize(count);
    return Nexil::makePtr<Nexil::Array<T>>(std::move(array));
}

/// An array that says it has more elements than there is memory for. Its second word is its size.
template <class T>
Nexil::Ptr<Nexil::Array<T>> claiming(std::uint64_t count)
{
    auto shared = Nexil::makeMutable<Nexil::Array<T>>(std::initializer_list<T>{T()});
    reinterpret_cast<std::uint64_t*>(shared.get())[1] = count;
    return shared;
}

constexpr std::uint64_t k4G = 1ull << 32;

TEST(Population, EmptyFormsHoldExactlyWhatTheirKeptDumpsShow)
{
    std::pair<char const*, void (*)(Object&)> const forms[] = {{"mesh", &populateMesh},
                                                               {"strand", &populateStrand},
                                                               {"fog_volume", &populateFogVolume},
                                                               {"level_set", &populateLevelSet},
                                                               {"instances", &populateInstances}};
    for (auto const& [name, populate] : forms) {
        std::ifstream file(VELDRIN_TEST_CORPUS "/dumps/" + std::string(name) + ".txt");
        std::string const kept(std::istreambuf_iterator<char>(file), {});
        EXPECT_EQ(support::dump(*support::filled(populate)) + "\n", kept);
    }
}

TEST(Population, ArraysAreMovedInAndNothingGrowsWithTheirSize)
{
    std::vector<std::uint64_t> allocations;
    for (std::uint64_t const size : {10u, 1000000u}) {
        auto positions = zeros<Math::float3>(size);
        auto corners = zeros<unsigned int>(size);
        auto offsets = zeros<unsigned int>(size + 1);
        void const* const addresses[] = {positions->data(), corners->data(), offsets->data()};
        auto mesh = createObject();

        auto const before = support::allocationCount();
        ASSERT_TRUE(populateMesh(std::move(positions), std::move(corners), std::move(offsets), *mesh));
        allocations.push_back(support::allocationCount() - before);

        EXPECT_EQ(support::arrayIn<Math::float3>(*mesh, sPointPosition)->data(), addresses[0]);
        EXPECT_EQ(support::arrayIn<unsigned int>(*mesh, sFaceVertex)->data(), addresses[1]);
        EXPECT_EQ(support::arrayIn<unsigned int>(*mesh, sFaceOffset)->data(), addresses[2]);
        for (char const* component : {sPointComp, sFaceVertexComp, sFaceComp})
            EXPECT_EQ(getElementCount(*mesh, component), size);
        // The stored objects have one holder, so that a later write copies nothing.
        auto const* const count = support::part(*mesh, sPointComp).get();
        ASSERT_TRUE(setElementCount(sPointComp, 5, *mesh));
        EXPECT_EQ(support::part(*mesh, sPointComp).get(), count);
    }
    EXPECT_EQ(allocations[0], allocations[1]);
}

TEST(Population, ArraysThatAreMissingEmptyOrTooLongLeaveTheObjectUntouched)
{
    auto const points = [] { return zeros<Math::float3>(3); };
    auto const indices = [] { return zeros<unsigned int>(3); };
    auto const object = createObject();
    setProperty(*object, sPointPosition, 7);
    setProperty(*object, "kept", 1);
    for (auto const& bad :
         {Nexil::Ptr<Nexil::Array<unsigned int>>(), zeros<unsigned int>(0), claiming<unsigned int>(k4G + 1)}) {
        EXPECT_FALSE(populateMesh(points(), bad, indices(), *object));
        EXPECT_FALSE(populateMesh(points(), indices(), bad, *object));
        EXPECT_FALSE(populateStrand(points(), bad, *object));
    }
    for (auto const& bad :
         {Nexil::Ptr<Nexil::Array<Math::float3>>(), zeros<Math::float3>(0), claiming<Math::float3>(k4G)}) {
        EXPECT_FALSE(populateMesh(bad, indices(), indices(), *object));
        EXPECT_FALSE(populateStrand(bad, indices(), *object));
        EXPECT_FALSE(populatePointCloud(bad, *object));
    }
    EXPECT_EQ(support::dump(*object), "{\n    point_position: 7 (int)\n    kept: 1 (int)\n}");
    // What was there under the names is replaced in its place.
    EXPECT_TRUE(populateStrand(points(), support::array<unsigned int>({0, 2, 5}), *object));
    EXPECT_EQ(support::names(object->keys())[0], "point_position");
    EXPECT_EQ(getElementCount(*object, sPointComp), 3u);
    EXPECT_EQ(getElementCount(*object, sStrandComp), 2u);
    EXPECT_EQ(support::valuesIn<unsigned int>(*object, sStrandOffset), (std::vector<unsigned int>{0, 2, 5}));

    // The longest that fit: offsets are one more than what they count.
    EXPECT_TRUE(populateMesh(claiming<Math::float3>(k4G - 1), claiming<unsigned int>(k4G - 1),
                             claiming<unsigned int>(k4G), *object));
    for (char const* component : {sPointComp, sFaceVertexComp, sFaceComp})
        EXPECT_EQ(getElementCount(*object, component), k4G - 1) << component;
}

TEST(Population, TrivialIndicesCountUpAndReuseTheArray)
{
    Nexil::Array<unsigned int> indices{9, 9, 9, 9};
    auto const* const storage = indices.data();
    populateTrivialRangeIndices(3, indices);
    EXPECT_EQ(indices, (Nexil::Array<unsigned int>{0, 1, 2}));
    EXPECT_EQ(indices.data(), storage);
    populateTrivialRangeIndices(100000, indices);
    EXPECT_EQ(indices[99999], 99999u);
    populateTrivialRangeIndices(k4G + 1, indices);
    EXPECT_EQ(indices.size(), 100000u);
}

} // namespace
