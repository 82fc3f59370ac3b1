#include "Foreign.h"

namespace foreign {

namespace {

    struct Local {
        int value;
    };

} // namespace

Nexil::Any make(Kind kind)
{
    Nexil::Any const made[] = {
        Pair<int>{1, 2}, Large<double>{{1, 2, 3}},
        Nexil::makePtr<Nexil::Array<Pair<int>>>(std::initializer_list<Pair<int>>{{3, 4}, {5, 6}}), Local{7}};
    return made[kind];
}

bool finds(Kind kind, Nexil::Any const& value)
{
    bool const found[] = {value.holds<Pair<int>>(), value.holds<Large<double>>(),
                          value.holds<Nexil::Ptr<Nexil::Array<Pair<int>>>>(), value.holds<Local>()};
    return found[kind];
}

} // namespace foreign
