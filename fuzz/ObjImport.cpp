/// Any bytes to the reader of OBJ files. What it takes becomes objects, which have to be valid and to come back the same
/// from the text that the writer makes of them.

#include "Check.h"
#include "Command.h"
#include "MeshArrays.h"

#include <veldrin/validation/MeshValidator.h>

#include <cstdint>
#include <cstring>

namespace {

using namespace Zon;
using fuzz::check;

template <class T>
bool haveSameBytes(Nexil::Array<T> const& a, Nexil::Array<T> const& b)
{
    return a.size() == b.size() && (a.empty() || std::memcmp(a.data(), b.data(), a.size() * sizeof(T)) == 0);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    MeshFile file;
    try {
        file = readObj("input", {reinterpret_cast<char const*>(data), size});
    } catch (Failure const&) {
        return 0;
    }
    // What a name may hold in a file is seen to before the writer.
    for (auto& part : file.parts)
        if (part.name)
            part.name = "part";
    auto const again = readObj("again", writeObj(file.parts));
    check(again.parts.size() == file.parts.size());
    for (std::size_t i = 0; i < file.parts.size(); ++i) {
        check(haveSameBytes(again.parts[i].positions, file.parts[i].positions));
        check(haveSameBytes(again.parts[i].corners, file.parts[i].corners));
        check(haveSameBytes(again.parts[i].offsets, file.parts[i].offsets));
    }
    for (auto& part : file.parts) {
        auto const object = makeObject(std::move(part));
        check(!object || Veldrin::Geometry::GeoValidator().validate(*object));
    }
    return 0;
}
