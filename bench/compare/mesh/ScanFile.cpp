#include "ScanFile.h"

#include <veldrin/geometry/Names.h>
#include <veldrin/io/ObjectStream.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Properties.h>

#include <algorithm>

namespace compare {

namespace {

    template <class T, class Target>
    void copyArray(Veldrin::Object const& mesh, char const* name, std::vector<Target>& target)
    {
        static_assert(sizeof(T) == sizeof(Target));
        auto const property = Veldrin::getPropertyAs<Nexil::Ptr<Veldrin::Object>>(mesh, name);
        auto const array =
            property ? Veldrin::getPropertyAs<Nexil::Ptr<Nexil::Array<T>>>(*property, Veldrin::Geometry::sData)
                     : nullptr;
        if (array)
            target.assign(reinterpret_cast<Target const*>(array->begin()),
                          reinterpret_cast<Target const*>(array->end()));
    }

} // namespace

PlainMesh readScan(char const* path)
{
    Nexil::Array<Nexil::Ptr<Veldrin::Object>> objects;
    if (!Veldrin::IO::deserialize(path, objects, {}, nullptr) || objects.empty())
        return {};
    PlainMesh mesh;
    mesh.order = "as scanned";
    copyArray<Veldrin::Math::float3>(*objects[0], Veldrin::Geometry::sPointPosition, mesh.points);
    copyArray<unsigned int>(*objects[0], Veldrin::Geometry::sFaceVertex, mesh.corners);
    copyArray<unsigned int>(*objects[0], Veldrin::Geometry::sFaceOffset, mesh.offsets);
    for (std::size_t f = 0; f < mesh.offsets.size(); ++f)
        if (mesh.offsets[f] != 3 * f)
            return {};
    return mesh;
}

} // namespace compare
