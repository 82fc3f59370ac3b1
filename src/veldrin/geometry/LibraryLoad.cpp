#include <cerrno>
#include <cstdio>
#include <cstdlib>

/// Tells which library was loaded, for people who wonder. VELDRIN_VERSION and VELDRIN_BUILD come from the build system.
namespace {

bool holdsNonZeroInteger(char const* text)
{
    char* end = nullptr;
    // A number too long for 64 bits becomes the largest one, which is not zero either.
    bool const isNonZero = std::strtoll(text, &end, 10) != 0;
    return isNonZero && *end == '\0';
}

[[gnu::constructor]] void writeVersionWhenAsked()
{
    char const* const request = std::getenv("MORAINE_DUMP_VERSION_INFO");
    if (!request || !holdsNonZeroInteger(request))
        return;
    // Where standard error is closed this fails, which is meant: there is nobody to tell.
    int const errorBefore = errno;
    std::fputs(" VeldrinGeometry: " VELDRIN_VERSION " (" VELDRIN_BUILD ", " __VERSION__ ")\n", stderr);
    errno = errorBefore;
}

} // namespace
