// Writes a cube to the file its argument names, reads it back, and ends with 0 when the points came back.
#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/geometry/Population.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/object/Object.h>

#include <iostream>
#include <utility>

int main(int argumentCount, char** arguments)
{
    if (argumentCount != 2)
        return 2;
    using namespace Veldrin;

    auto cube = createObject();
    Geometry::populateCubeMesh(2, *cube);
    Nexil::Array<Nexil::Ptr<Object>> const written{Nexil::Ptr<Object>(std::move(cube))};
    if (!IO::serialize(written, arguments[1], {}, nullptr))
        return 1;

    Nexil::Array<Nexil::Ptr<Object>> read;
    if (!IO::deserialize(arguments[1], read, {}, nullptr) || read.size() != 1)
        return 1;
    auto const pointCount = Geometry::getElementCount(*read[0], Geometry::sPointComp);
    std::cout << pointCount << " points came back\n";
    return pointCount == 8 ? 0 : 1;
}
