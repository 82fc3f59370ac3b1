#include "TagSample.h"

#include <veldrin/tags/TagData.h>

#include <map>

using namespace Veldrin;
using namespace Veldrin::Geometry;

namespace {

void addComponent(Object& geometry, char const* name, std::size_t count)
{
    setProperty(geometry, name, support::filled([&](Object& component) {
                    populateComponentGeoProperty(static_cast<unsigned int>(count), component);
                }));
}

void addIndices(Object& geometry, char const* name, char const* target, std::vector<unsigned int> const& indices)
{
    setProperty(geometry, name, support::filled([&](Object& property) {
                    createDataGeoProperty(kInvalidIndex, target, support::array(indices), property);
                }));
}

} // namespace

Nexil::MutablePtr<Object> TagSample::build() const
{
    auto object = createObject();
    addComponent(*object, sPointComp, pointCount);
    if (!faces.empty()) {
        std::vector<unsigned int> corners;
        std::vector<unsigned int> offsets{0};
        for (auto const& face : faces) {
            corners.insert(corners.end(), face.begin(), face.end());
            offsets.push_back(static_cast<unsigned int>(corners.size()));
        }
        addComponent(*object, sFaceComp, faces.size());
        addComponent(*object, sFaceVertexComp, corners.size());
        addIndices(*object, sFaceOffset, sFaceComp, offsets);
        addIndices(*object, sFaceVertex, sFaceVertexComp, corners);
    }
    if (!strandSizes.empty()) {
        std::vector<unsigned int> offsets{0};
        for (auto const size : strandSizes)
            offsets.push_back(offsets.back() + size);
        addComponent(*object, sStrandComp, strandSizes.size());
        addIndices(*object, sStrandOffset, sStrandComp, offsets);
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
