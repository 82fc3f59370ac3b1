#include <nexil/SeededHash.h>

#include <gtest/gtest.h>

#include <set>
#include <string>

namespace {

TEST(SeededHash, TellsNamesApartByEveryByteAndTheirLength)
{
    // Names of zeros differ by length alone, the others in one byte, at each place of each length.
    std::set<std::uint64_t> hashes;
    std::size_t nameCount = 0;
    for (std::size_t length = 0; length <= 40; ++length)
        for (std::size_t place = 0; place <= length; ++place) {
            std::string name(length + 1, '\0');
            name[place] = place < length ? '\x80' : '\0';
            auto const hash = Nexil::Internal::seededHash({name.data(), length});
            EXPECT_EQ(hash, Nexil::Internal::seededHash(name.substr(0, length))); // what lies behind does not count
            hashes.insert(hash);
            ++nameCount;
        }
    EXPECT_EQ(hashes.size(), nameCount);
}

} // namespace
