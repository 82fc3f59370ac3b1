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
        support::Indices offsets{0};
        for (auto const size : strandSizes)
            offsets.push_back(offsets.back() + size);
        auto const strands = support::strands(std::vector<Math::float3>(offsets.back()), offsets);
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

TagSample const& taggedCube()
{
    static TagSample const sample{8,
                                  {{0, 1, 2, 3}, {4, 7, 6, 5}, {2, 6, 7, 3}, {0, 4, 5, 1}, {4, 0, 3, 7}, {1, 5, 6, 2}},
                                  {3, 0, 5},
                                  {{"a", "point_component", "01101101"},
                                   {"b", "face_component", "100101"},
                                   {"c", "face_vertex_component", "100100100110111001011001"},
                                   {"d", "strand_component", "101"},
                                   {"ab", "point_component", "110"},
                                   {"a.b", "other", "01"}}};
    return sample;
}
