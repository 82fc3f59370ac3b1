#include <veldrin/veldrin.h>

#include <iostream>

int main()
{
    using namespace Veldrin;

    auto mesh = createObject();
    Geometry::populateCubeMesh(2.0f, *mesh);
    setProperty(*mesh, "made_by", "the example");

    Nexil::Array<Nexil::Ptr<Object>> saved{Nexil::Ptr<Object>(std::move(mesh))};
    Nexil::Array<Nexil::Ptr<Object>> loaded;
    if (!IO::serialize(saved, "cube.zon", {}, nullptr) || !IO::deserialize("cube.zon", loaded, {}, nullptr))
        return 1;

    Object const& cube = *loaded[0];
    std::cout << Geometry::getElementCount(cube, Geometry::sPointComp) << " points, "
              << Geometry::getElementCount(cube, Geometry::sFaceComp) << " faces, made by "
              << getPropertyAs<Nexil::String>(cube, "made_by") << "\n";
    return Object::isA(cube, *Geometry::getMeshPrototype()) ? 0 : 1;
}
