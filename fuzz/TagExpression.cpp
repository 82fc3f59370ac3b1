/// Any text as a tag expression: the whole input, and each of its lines. What parses is dumped, parsed again and
/// resolved, both ways, on a small geometry whose tags must stay as they are.

#include "Check.h"

#include <tags/TagSample.h>

#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/TagResolver.h>

#include <cstdint>
#include <sstream>
#include <string_view>

namespace {

using namespace Veldrin;
using fuzz::check;

std::string dumpOf(std::string_view text)
{
    std::ostringstream stream;
    VLD::Utils::Internal::parseTagExpression(text)->dump(stream);
    return stream.str();
}

void run(std::string_view text)
{
    static auto const cube = taggedCube().build();
    Geometry::TagResolver resolver;
    auto const status = resolver.parses(Nexil::String(text));
    check(status.ok == status.message.empty() && status.byteOffset <= text.size());
    if (!status)
        return;
    auto const dump = dumpOf(text);
    check(dumpOf(dump) == dump);
    Geometry::TagResolver again;
    check(again.parses(Nexil::String(std::string_view(dump))).ok);
    Nexil::String component;
    Nexil::String componentAgain;
    auto const mask = resolver.resolve(*cube, component);
    auto const maskAgain = again.resolve(*cube, componentAgain);
    check(mask && maskAgain && *mask == *maskAgain && component == componentAgain);
    for (auto const& tag : taggedCube().tags)
        check(flagsOf(support::arrayIn<bool>(*cube, tag.name.c_str())) == tag.flags);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    std::string_view rest(reinterpret_cast<char const*>(data), size);
    run(rest);
    while (!rest.empty()) {
        auto const end = rest.find('\n');
        run(rest.substr(0, end));
        rest.remove_prefix(end == std::string_view::npos ? rest.size() : end + 1);
    }
    return 0;
}
