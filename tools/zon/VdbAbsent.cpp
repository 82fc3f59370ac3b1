#include "Command.h"
#include "VdbFile.h"

namespace Zon {

namespace {

    [[noreturn]] void failWithoutVdb()
    {
        throw Failure("this program was built without OpenVDB: install it (Debian: libopenvdb-dev) and build again");
    }

} // namespace

VdbVolumes readVdb(std::string const&)
{
    failWithoutVdb();
}

VdbReport writeVdb(Objects const&, std::string const&)
{
    failWithoutVdb();
}

Nexil::Ptr<Veldrin::Object> levelSetOfMesh(Nexil::Array<Veldrin::Math::float3> const&,
                                           Nexil::Array<unsigned int> const&, float, float)
{
    failWithoutVdb();
}

} // namespace Zon
