#include <gmock/gmock.h>

#include <cstdio>
#include <filesystem>
#include <string>

namespace {

/// Standard error of this program, started anew with the variable set.
std::string errorsOfChildWith(std::string const& value)
{
    auto const self = std::filesystem::read_symlink("/proc/self/exe").string();
    auto const command = "MORAINE_DUMP_VERSION_INFO='" + value + "' '" + self + "' --gtest_list_tests 2>&1 >/dev/null";
    std::string text;
    FILE* const pipe = popen(command.c_str(), "r");
    for (int c = std::fgetc(pipe); c != EOF; c = std::fgetc(pipe))
        text += static_cast<char>(c);
    EXPECT_EQ(pclose(pipe), 0) << command;
    return text;
}

TEST(LibraryLoad, WritesOneVersionLineWhenAskedByANonZeroInteger)
{
    for (char const* yes : {"1", "-3", " 7", "99999999999999999999"})
        EXPECT_THAT(errorsOfChildWith(yes),
                    testing::MatchesRegex(" VeldrinGeometry: [0-9]+\\.[0-9]+\\.[0-9]+ [^\n]+\n"));
    for (char const* no : {"", "-0", "yes", "1x"})
        EXPECT_EQ(errorsOfChildWith(no), "") << no;
}

} // namespace
