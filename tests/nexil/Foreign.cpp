#include "Foreign.h"

namespace foreign {

namespace {

    struct Local {
        int value;
    };

} // namespace

Nexil::Any make(Kind kind)
{
    switch (kind) {
    case Kind::Small: return Pair<int>{1, 2};
    case Kind::Heap: return Large<double>{{1, 2, 3}};
    case Kind::PointerToArray:
        return Nexil::makePtr<Nexil::Array<Pair<int>>>(std::initializer_list<Pair<int>>{{3, 4}, {5, 6}});
    case Kind::Local: return Local{7};
    }
    return {};
}

bool finds(Kind kind, Nexil::Any const& value)
{
    switch (kind) {
    case Kind::Small: return value.holds<Pair<int>>();
    case Kind::Heap: return value.holds<Large<double>>();
    case Kind::PointerToArray: return value.holds<Nexil::Ptr<Nexil::Array<Pair<int>>>>();
    case Kind::Local: return value.holds<Local>();
    }
    return false;
}

} // namespace foreign
