#include "TagSample.h"

#include <veldrin/tags/TagData.h>

#include <map>

using namespace Veldrin;
using namespace Veldrin::Geometry;

Nexil::MutablePtr<Object> TagSample::build() const
{
    auto object = createObject();
    if (faces.empty())
        setProperty(*object, sPointComp, support::filled([&](Object& component) {
            populateComponentGeoProperty(static_cast<unsigned int>(pointCount), component);
        }));
    else
        object = support::mesh(std::vector<Math::float3>(pointCount), faces);
    if (!strandSizes.empty()) {
        std::vector<unsigned int> offsets{0};
        for (auto const size : strandSizes)
            offsets.push_back(offsets.back() + size);
        auto const strands = support::filled([&](Object& made) {
            populateStrand(support::array(std::vector<Math::float3>(offsets.back())), support::array(offsets), made);
        });
        for (auto const* name : {sStrandComp, sStrandOffset})
            setProperty(*object, name, support::part(*strands, name));
    }
    std::map<std::string, MaskPtr> masks;
    for (Tag const& tag : tags) {
        auto const mask = masks[tag.name] = tag.sameAs.empty() ? maskOf(tag.flags) : masks.at(tag.sameAs);
        setProperty(*object, Nexil::String(std::string_view(tag.name)), support::filled([&](Object& property) {
            populateTag(Nexil::String(std::string_view(tag.component)), mask, property);
        }));
    }
    return object;
}
