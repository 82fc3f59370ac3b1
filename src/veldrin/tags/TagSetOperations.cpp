#include <veldrin/tags/TagSetOperations.h>

#include <veldrin/tags/internal/MaskLoops.h>

namespace Veldrin::Geometry {

void unionTagData(Nexil::Array<bool> const& a, Nexil::Array<bool>& b)
{
    MaskLoops::changeBy(b, a, MaskLoops::kUnion);
}

void intersectTagData(Nexil::Array<bool> const& a, Nexil::Array<bool>& b)
{
    MaskLoops::changeBy(b, a, MaskLoops::kIntersection);
}

void subtractTagData(Nexil::Array<bool> const& a, Nexil::Array<bool>& b)
{
    MaskLoops::changeBy(b, a, [](auto right, auto left) { return MaskLoops::kDifference(left, right); });
}

void negateTagData(Nexil::Array<bool>& a)
{
    MaskLoops::changeEach(a, MaskLoops::kComplement);
}

} // namespace Veldrin::Geometry
