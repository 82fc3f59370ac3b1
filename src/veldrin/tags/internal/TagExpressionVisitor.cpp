#include <veldrin/tags/internal/TagExpressionVisitor.h>

#include <nexil/parallel/Parallel.h>
#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/geometry/Prototypes.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/tags/internal/MaskLoops.h>
#include <veldrin/tags/internal/NamePattern.h>

#include <algorithm>
#include <utility>
#include <vector>

namespace Veldrin::Geometry::Internal {

struct TagExpressionVisitor::Selection {
    Nexil::Ptr<Nexil::Array<bool>> data;
    ComponentRank rank = ComponentRank::None;
};

namespace {

    using namespace VLD::Utils::Internal;
    using Mask = Nexil::Array<bool>;
    using MaskPtr = Nexil::Ptr<Mask>;

    // Further down there are tasks enough, and a task takes far more stack than a call.
    constexpr int kMostNestedTasks = 16;

    /// Whether nobody else sees a change of the mask.
    bool isOwned(MaskPtr const& mask) noexcept
    {
        return mask.useCount() == 1;
    }

    /// A mask of that size, its flags still to be filled.
    Nexil::MutablePtr<Mask> unfilledMask(std::uint64_t size)
    {
        auto mask = Nexil::makeMutable<Mask>();
        Nexil::Internal::resizeUninitialized(*mask, size);
        return mask;
    }

    /// rule(left, right) over the shorter of both, and what `right` has beyond it.
    template <class Rule>
    MaskPtr combined(MaskPtr left, MaskPtr right, Rule const& rule)
    {
        if (isOwned(right)) {
            Nexil::MutablePtr<Mask> own(std::move(right));
            MaskLoops::changeBy(*own, *left, [rule](auto ofRight, auto ofLeft) { return rule(ofLeft, ofRight); });
            return own;
        }
        // The same flags in the other mask: a long chain then goes on in one mask instead of a new one per operation.
        if (isOwned(left) && left->size() == right->size()) {
            Nexil::MutablePtr<Mask> own(std::move(left));
            MaskLoops::changeBy(*own, *right, rule);
            return own;
        }
        auto made = unfilledMask(right->size());
        MaskLoops::fill(*made, *left, *right, rule);
        return made;
    }

    MaskPtr combined(BinaryOp::Op op, MaskPtr left, MaskPtr right)
    {
        switch (op) {
        case BinaryOp::Op::Union: return combined(std::move(left), std::move(right), MaskLoops::kUnion);
        case BinaryOp::Op::Intersection: return combined(std::move(left), std::move(right), MaskLoops::kIntersection);
        case BinaryOp::Op::Difference: break;
        }
        return combined(std::move(left), std::move(right), MaskLoops::kDifference);
    }

    // Not inlined, nor is what runs tasks: the frame would become part of each visit's, a thousand within each other.
    [[gnu::noinline]] MaskPtr complementOf(MaskPtr mask)
    {
        if (isOwned(mask)) {
            Nexil::MutablePtr<Mask> own(std::move(mask));
            MaskLoops::changeEach(*own, MaskLoops::kComplement);
            return own;
        }
        auto made = unfilledMask(mask->size());
        MaskLoops::fill(*made, *mask, MaskLoops::kComplement);
        return made;
    }

    /// A single tag is at hand at once; everything else may be long work.
    bool isLongWork(Expression const& expression)
    {
        auto const* const literal = dynamic_cast<Literal const*>(&expression);
        return !literal || literal->kind() == TokenKind::Pattern;
    }

    template <class First, class Second>
    [[gnu::noinline]] void runAsTasks(First const& first, Second const& second)
    {
        Nexil::parallel::invoke(first, second);
    }

    template <class First, class Second>
    void runBoth(bool asTasks, First const& first, Second const& second)
    {
        if (asTasks) {
            runAsTasks(first, second);
        } else {
            first();
            second();
        }
    }

} // namespace

TagExpressionVisitor::TagExpressionVisitor(Object const& geometryToRead, int nestingOfNode)
    : geometry(geometryToRead), data(Nexil::makePtr<Mask>()), nesting_(nestingOfNode)
{
}

TagExpressionVisitor::~TagExpressionVisitor() = default;

void TagExpressionVisitor::visit(Literal& literal)
{
    auto const text = literal.id();
    if (literal.kind() == TokenKind::Name)
        take(tagNamed(Nexil::String(text)));
    else if (text.find_first_not_of('*') == std::string::npos)
        take(allPoints());
    else
        take(tagsLike(text));
}

void TagExpressionVisitor::visit(NegateExpression& complement)
{
    auto selection = operand(complement.expr());
    selection.data = complementOf(std::move(selection.data));
    take(std::move(selection));
}

void TagExpressionVisitor::visit(FuncOp& function)
{
    auto selection = operand(function.expr());
    auto const name = function.id();
    if (selection.rank != ComponentRank::None) {
        if (name == "v")
            carry(selection, ComponentRank::Point);
        else if (name == "s")
            carry(selection, ComponentRank::Strand);
        else if (name == "f")
            carry(selection, ComponentRank::Face);
        else if (name == "fv")
            carry(selection, ComponentRank::FaceVertex);
    }
    take(std::move(selection));
}

void TagExpressionVisitor::visit(BinaryOp& operation)
{
    // Along the chain, each operation is carried out while the right operand of the next one is worked out, so that no
    // more than three masks are there at once.
    auto const chain = leftChain(operation);
    Expression& first = chain.front()->left();
    bool const mayRunTasks = nesting_ < kMostNestedTasks;
    Selection left;
    Selection right;
    runBoth(
        mayRunTasks && isLongWork(first) && isLongWork(chain.front()->right()), [&] { left = operand(first); },
        [&] { right = operand(chain.front()->right()); });
    for (std::size_t i = 0; i < chain.size(); ++i) {
        auto const joinThese = [&] { left = joined(chain[i]->op(), std::move(left), std::move(right)); };
        if (i + 1 == chain.size()) {
            joinThese();
            break;
        }
        Expression& nextExpression = chain[i + 1]->right();
        Selection next;
        runBoth(mayRunTasks && isLongWork(nextExpression), joinThese, [&] { next = operand(nextExpression); });
        right = std::move(next);
    }
    take(std::move(left));
}

TagExpressionVisitor::Selection TagExpressionVisitor::operand(Expression& expression) const
{
    TagExpressionVisitor visitor(geometry, nesting_ + 1);
    expression.visit(visitor);
    return {std::move(visitor.data), visitor.rank};
}

TagExpressionVisitor::Selection TagExpressionVisitor::joined(BinaryOp::Op op, Selection left, Selection right) const
{
    // What resolved to nothing is ignored, whatever the operator.
    if (right.rank == ComponentRank::None)
        return left;
    if (left.rank == ComponentRank::None)
        return right;
    auto const target = std::max(left.rank, right.rank);
    carry(right, target);
    carry(left, target);
    return {combined(op, std::move(left.data), std::move(right.data)), target};
}

TagExpressionVisitor::Selection TagExpressionVisitor::tagNamed(Nexil::String const& name) const
{
    MaskPtr mask;
    Nexil::String component;
    if (getTagData(geometry, name, mask, component))
        if (auto const rankOfTag = rankOf(component); rankOfTag != ComponentRank::None)
            return {std::move(mask), rankOfTag};
    return {Nexil::makePtr<Mask>(), ComponentRank::None};
}

TagExpressionVisitor::Selection TagExpressionVisitor::allPoints() const
{
    auto mask = unfilledMask(getElementCount(geometry, sPointComp));
    MaskLoops::changeEach(*mask, [](MaskLoops::Byte) { return MaskLoops::Byte(1); });
    return {std::move(mask), ComponentRank::Point};
}

TagExpressionVisitor::Selection TagExpressionVisitor::tagsLike(std::string const& pattern) const
{
    NamePattern const names(pattern);
    std::vector<Selection> tags;
    auto target = ComponentRank::None;
    for (auto const& name : getGeoPropNamesByPrototype(geometry, *getDataGeoPropPrototype(sGenericDataGeoProp))) {
        if (!names.matches(name.view()))
            continue;
        auto tag = tagNamed(name);
        target = std::max(target, tag.rank);
        if (tag.rank != ComponentRank::None)
            tags.push_back(std::move(tag));
    }
    Selection all{Nexil::makePtr<Mask>(), target};
    for (std::size_t i = 0; i < tags.size(); ++i) {
        auto tag = std::move(tags[i]);
        carry(tag, target);
        all.data =
            i == 0 ? std::move(tag.data) : combined(BinaryOp::Op::Union, std::move(tag.data), std::move(all.data));
    }
    return all;
}

void TagExpressionVisitor::carry(Selection& selection, ComponentRank target) const
{
    selection.data = convertTagData(geometry, std::move(selection.data), componentOf(selection.rank),
                                    componentOf(target), TagConversionStyle::AllElements, nullptr);
    selection.rank = target;
}

void TagExpressionVisitor::take(Selection&& selection) noexcept
{
    data = std::move(selection.data);
    rank = selection.rank;
}

} // namespace Veldrin::Geometry::Internal
