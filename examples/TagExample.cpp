#include <veldrin/veldrin.h>

#include <iostream>

int main()
{
    using namespace Veldrin;
    using namespace Veldrin::Geometry;

    auto square = createObject();
    populatePlaneMesh(2.0f, 2, *square);

    // A tag of one's own making: a flag per point.
    auto const positions =
        getPropertyAs<Nexil::Ptr<Nexil::Array<Math::float3>>>(*getDataGeoProperty(*square, sPointPosition), sData);
    Nexil::Array<bool> flags;
    for (auto const& position : *positions)
        flags.push_back(position[0] >= 0);
    auto right = createObject();
    populateTag(sPointComp, Nexil::makePtr<Nexil::Array<bool>>(std::move(flags)), *right);
    setProperty(*square, createTagName(sPointComp, "right"), std::move(right)); // under "point_right_tag"

    // All faces but those whose points are all on the right.
    TagResolver resolver;
    if (auto const status = resolver.parses("!f(point_right_tag)"); !status) {
        std::cerr << status.message << " at byte " << status.byteOffset << "\n";
        return 1;
    }
    Nexil::String component;
    auto const mask = resolver.resolve(*square, component);
    std::cout << component << ":";
    for (bool const isSelected : *mask)
        std::cout << " " << isSelected;
    std::cout << "\n";

    // Kept with the others, under "face_left_tag".
    auto left = createObject();
    populateTag(component, mask, *left);
    setProperty(*square, createTagName(component, "left"), std::move(left));
    return component == sFaceComp && mask->size() == 4 ? 0 : 1;
}
