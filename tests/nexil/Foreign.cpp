#include "Foreign.h"

namespace foreign {

namespace {

    struct Local {
        int value;
    };

    using PairArray = Nexil::Array<Pair<int>>;

} // namespace

Nexil::Any make(Kind kind)
{
    Nexil::Any const made[] = {Pair<int>{1, 2},
                               Nexil::makePtr<PairArray>(std::initializer_list<Pair<int>>{{3, 4}, {5, 6}}), Local{7}};
    return made[kind];
}

bool finds(Kind kind, Nexil::Any const& value)
{
    bool const found[] = {value.holds<Pair<int>>(), value.holds<Nexil::Ptr<PairArray>>(), value.holds<Local>()};
    return found[kind];
}

} // namespace foreign
