#include <support/Geometry.h>

#include <gmock/gmock.h>

#include <array>
#include <cstdio>
#include <filesystem>
#include <string>

namespace {

/// Standard error of this program, started anew with the variable set.
std::string errorsOfChildWith(std::string const& value, char const* redirections = "2>&1 >/dev/null")
{
    auto const self = std::filesystem::read_symlink("/proc/self/exe").string();
    auto const command = "MORAINE_DUMP_VERSION_INFO='" + value + "' '" + self + "' --gtest_list_tests " + redirections;
    std::string text;
    FILE* const pipe = popen(command.c_str(), "r");
    std::array<char, 256> buffer{};
    while (std::size_t const count = std::fread(buffer.data(), 1, buffer.size(), pipe))
        text.append(buffer.data(), count);
    EXPECT_EQ(pclose(pipe), 0) << command;
    return text;
}

TEST(LibraryLoad, WritesOneVersionLineWhenAskedByANonZeroInteger)
{
    for (char const* yes : {"1", "-3", " 7", "99999999999999999999"})
        EXPECT_THAT(errorsOfChildWith(yes),
                    testing::MatchesRegex(" VeldrinGeometry: [0-9]+\\.[0-9]+\\.[0-9]+ [^\n]+\n"))
            << yes;
    for (char const* no : {"", "0", "-0", "yes", "1x"})
        EXPECT_EQ(errorsOfChildWith(no), "") << no;
    // Nor where there is nowhere to write to.
    EXPECT_THAT(errorsOfChildWith("1", "2>&-"), testing::Not(testing::HasSubstr(": 0.")));
}

} // namespace
