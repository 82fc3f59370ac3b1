/// Any text as a tag expression: the whole input, and each of its lines. What parses is dumped, parsed again and
/// resolved, both ways, on a small geometry whose tags must stay as they are.

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/object/Properties.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/tags/TagParser.h>
#include <veldrin/tags/TagResolver.h>

#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string_view>
#include <vector>

namespace {

using namespace Veldrin;
using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;

void check(bool condition)
{
    if (!condition)
        std::abort();
}

/// A cube with tags of one letter, of all components, one of them too short.
class TaggedCube {
public:
    TaggedCube() : cube_(createObject())
    {
        Geometry::populateCubeMesh(1, *cube_);
        std::pair<char const*, char const*> const tags[] = {
            {"a", Geometry::sPointComp},  {"b", Geometry::sFaceComp},   {"c", Geometry::sFaceVertexComp},
            {"d", Geometry::sStrandComp}, {"ab", Geometry::sPointComp}, {"a.b", "other"}};
        for (auto const& [name, component] : tags) {
            Nexil::Array<bool> mask;
            mask.resize(name[1] == 'b' ? 3 : Geometry::getElementCount(*cube_, component));
            for (std::uint64_t i = 0; i < mask.size(); ++i)
                mask[i] = (i * i + static_cast<unsigned char>(name[0])) % 3 == 0;
            original_.push_back(mask);
            stored_.push_back(Nexil::makePtr<Nexil::Array<bool>>(std::move(mask)));
            auto tag = createObject();
            Geometry::populateTag(component, stored_.back(), *tag);
            setProperty(*cube_, name, std::move(tag));
        }
    }

    [[nodiscard]] Object const& object() const { return *cube_; }

    [[nodiscard]] bool isUnchanged() const
    {
        for (std::size_t i = 0; i < stored_.size(); ++i)
            if (!(*stored_[i] == original_[i]))
                return false;
        return true;
    }

private:
    Nexil::MutablePtr<Object> cube_;
    std::vector<MaskPtr> stored_;
    std::vector<Nexil::Array<bool>> original_;
};

std::string dumpOf(std::string_view text)
{
    std::ostringstream stream;
    VLD::Utils::Internal::parseTagExpression(text)->dump(stream);
    return stream.str();
}

void run(std::string_view text)
{
    static TaggedCube const cube;
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
    auto const mask = resolver.resolve(cube.object(), component);
    auto const maskAgain = again.resolve(cube.object(), componentAgain);
    check(mask && maskAgain && *mask == *maskAgain && component == componentAgain);
    check(cube.isUnchanged());
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
