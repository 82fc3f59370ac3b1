#include "TagSample.h"
#include "TreeText.h"

#include <veldrin/tags/TagResolver.h>

#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <regex>

namespace {

using namespace Veldrin;

constexpr char const* kComponents[] = {"", "face_component", "face_vertex_component", "strand_component",
                                       "point_component"};

/// An expression as the generator makes it and the oracle reads it.
struct Node {
    char kind; ///< '+', '-', '^', '!', '(' for a function, 'a' for a name, '*' for a pattern
    std::string name;
    std::shared_ptr<Node> left, right;
};
using NodePtr = std::shared_ptr<Node>;

std::string textOf(Node const& node)
{
    auto const grouped = [](Node const& part) { return "(" + textOf(part) + ")"; };
    switch (node.kind) {
    case 'a':
    case '*': return node.name;
    case '!': return "!" + grouped(*node.left);
    case '(': return node.name + grouped(*node.left);
    default: return grouped(*node.left) + node.kind + grouped(*node.right);
    }
}

/// The tree that the text has to give, in the form of `trees::treeOf`.
std::string treeOf(Node const& node)
{
    switch (node.kind) {
    case 'a': return node.name;
    case '*': return "/" + node.name + "/";
    case '!': return "(! " + treeOf(*node.left) + ")";
    case '(': return "(" + node.name + ": " + treeOf(*node.left) + ")";
    default: return std::string("(") + node.kind + " " + treeOf(*node.left) + " " + treeOf(*node.right) + ")";
    }
}

struct Selected {
    int rank = 0;
    std::string flags;
};

/// What an expression selects, worked out as plainly as can be: strings of flags, pairs of elements that touch.
class Oracle {
public:
    explicit Oracle(TagSample const& sample) : sample_(sample)
    {
        unsigned int corner = 0;
        for (unsigned int face = 0; face < sample.faces.size(); ++face)
            for (unsigned int const point : sample.faces[face]) {
                touching_[1][2].emplace_back(face, corner);
                touching_[2][4].emplace_back(corner++, point);
                touching_[1][4].emplace_back(face, point);
            }
        unsigned int next = 0;
        for (unsigned int strand = 0; strand < sample.strandSizes.size(); ++strand)
            for (unsigned int i = 0; i < sample.strandSizes[strand]; ++i)
                touching_[3][4].emplace_back(strand, next++);
        counts_ = {0, sample.faces.size(), corner, sample.strandSizes.size(), sample.pointCount};
    }

    Selected evaluate(Node const& node) const
    {
        if (node.kind == 'a' || node.kind == '*')
            return select(node.name);
        Selected left = evaluate(*node.left);
        if (node.kind == '!') {
            for (char& flag : left.flags)
                flag = flag == '1' ? '0' : '1';
            return left;
        }
        if (node.kind == '(') {
            std::map<std::string, int> const targets{{"f", 1}, {"fv", 2}, {"s", 3}, {"v", 4}};
            return left.rank != 0 && targets.count(node.name) ? carried(left, targets.at(node.name)) : left;
        }
        Selected right = evaluate(*node.right);
        if (left.rank == 0 || right.rank == 0)
            return left.rank == 0 && right.rank != 0 ? right : left;
        int const rank = std::max(left.rank, right.rank);
        return combined(node.kind, carried(left, rank), carried(right, rank));
    }

private:
    static Selected combined(char kind, Selected const& left, Selected right)
    {
        for (std::size_t i = 0; i < std::min(left.flags.size(), right.flags.size()); ++i) {
            bool const a = left.flags[i] == '1';
            bool const b = right.flags[i] == '1';
            right.flags[i] = (kind == '+' ? a || b : kind == '-' ? a && !b : a && b) ? '1' : '0';
        }
        return right;
    }

    Selected carried(Selected const& from, int rank) const
    {
        if (from.rank == rank)
            return from;
        int const low = std::min(from.rank, rank);
        int const high = std::max(from.rank, rank);
        if ((low == 3 || high == 3) && low != 4 && high != 4)
            return {rank, ""};
        bool const needsAll = rank < from.rank && rank != 2;
        std::string flags(counts_[static_cast<std::size_t>(rank)], '0');
        std::string missed = flags;
        for (auto const& [lower, higher] : touching_[low][high]) {
            auto const source = rank > from.rank ? lower : higher;
            auto const target = rank > from.rank ? higher : lower;
            (source < from.flags.size() && from.flags[source] == '1' ? flags : missed)[target] = '1';
        }
        for (std::size_t i = 0; needsAll && i < flags.size(); ++i)
            flags[i] = flags[i] == '1' && missed[i] == '0' ? '1' : '0';
        return {rank, flags};
    }

    Selected select(std::string const& name) const
    {
        if (name == "*")
            return {4, std::string(sample_.pointCount, '1')};
        std::regex const pattern(std::regex_replace(name, std::regex("\\*"), ".*"));
        std::vector<Selected> found;
        int rank = 0;
        for (auto const& tag : sample_.tags)
            if (auto const place = std::ranges::find(kComponents, tag.component);
                place != std::end(kComponents) && std::regex_match(tag.name, pattern)) {
                found.push_back({static_cast<int>(place - std::begin(kComponents)), tag.flags});
                rank = std::max(rank, found.back().rank);
            }
        Selected result;
        for (auto const& tag : found)
            result = result.rank == 0 ? carried(tag, rank) : combined('+', carried(tag, rank), result);
        return result;
    }

    TagSample const& sample_;
    std::vector<std::pair<unsigned int, unsigned int>> touching_[5][5];
    std::array<std::size_t, 5> counts_{};
};

class Generator {
public:
    explicit Generator(unsigned int seed) : random_(seed) {}

    std::size_t below(std::size_t end) { return random_() % end; }

    std::string flags(std::size_t count)
    {
        std::string made(count, '0');
        for (char& flag : made)
            flag = below(3) != 0 ? '1' : '0';
        return made;
    }

    /// Points, faces and strands of any number, tags on each of them, some of a wrong size.
    TagSample sample(std::size_t size)
    {
        TagSample sample;
        sample.pointCount = 1 + below(size);
        sample.faces.resize(below(size));
        std::size_t corners = 0;
        for (auto& face : sample.faces) {
            for (auto i = below(5); i > 0; --i)
                face.push_back(static_cast<unsigned int>(below(sample.pointCount)));
            corners += face.size();
        }
        for (std::size_t used = 0; used < sample.pointCount; used += sample.strandSizes.back())
            sample.strandSizes.push_back(static_cast<unsigned int>(std::min(below(4), sample.pointCount - used)));
        std::size_t const counts[] = {3, sample.faces.size(), corners, sample.strandSizes.size(), sample.pointCount};
        for (std::size_t i = 0; i < 10; ++i) {
            std::size_t const rank = i < 2 ? 0 : 1 + below(4);
            auto const wrong = below(8);
            auto const count = wrong == 0 ? counts[rank] / 2 : wrong == 1 ? counts[rank] + 2 : counts[rank];
            sample.tags.push_back({std::string(1, "xyz"[below(3)]) + "_" + std::to_string(i),
                                   rank == 0 ? "other_component" : kComponents[rank], flags(count)});
        }
        for (auto const i : {3u, 5u}) {
            sample.tags[i].flags = sample.tags[i + 1].flags = flags(sample.pointCount);
            sample.tags[i].component = sample.tags[i + 1].component = kComponents[4];
            sample.tags[i + 1].sameAs = sample.tags[i].name;
        }
        return sample;
    }

    NodePtr expression(TagSample const& sample, int depth)
    {
        auto const operand = [&] { return expression(sample, depth - 1); };
        auto const choice = depth <= 0 ? 9 : below(11);
        if (choice < 6)
            return std::make_shared<Node>(Node{"+-^"[choice / 2], "", operand(), operand()});
        if (choice < 7)
            return std::make_shared<Node>(Node{'!', "", operand(), nullptr});
        if (choice < 9) {
            char const* const functions[] = {"v", "f", "fv", "s", "other"};
            return std::make_shared<Node>(Node{'(', functions[below(5)], operand(), nullptr});
        }
        char const* const patterns[] = {"*", "x_*", "*_3", "y*", "none*"};
        if (below(4) == 0)
            return std::make_shared<Node>(Node{'*', patterns[below(5)], nullptr, nullptr});
        auto const name = below(8) == 0 ? "missing" : sample.tags[below(sample.tags.size())].name;
        return std::make_shared<Node>(Node{'a', name, nullptr, nullptr});
    }

private:
    std::mt19937 random_;
};

void expectSelected(Node const& node, std::string const& spelling, Object const& geometry, Selected const& expected)
{
    EXPECT_EQ(trees::treeOf(*trees::parseTagExpression(spelling)), treeOf(node)) << spelling;
    Geometry::TagResolver resolver;
    ASSERT_TRUE(resolver.parses(Nexil::String(std::string_view(spelling)))) << spelling;
    Nexil::String component;
    auto const mask = resolver.resolve(geometry, component);
    EXPECT_EQ(component, kComponents[expected.rank]) << spelling;
    EXPECT_TRUE(flagsOf(mask) == expected.flags) << spelling;
}

void checkExpressions(unsigned int seed, std::size_t size, int expressionCount)
{
    SCOPED_TRACE(seed);
    Generator generator(seed);
    TagSample const sample = generator.sample(size);
    Oracle const oracle(sample);
    auto const geometry = sample.build();
    std::vector<MaskPtr> stored;
    for (auto const& tag : sample.tags)
        stored.push_back(support::arrayIn<bool>(*geometry, tag.name.c_str()));
    for (int i = 0; i < expressionCount; ++i) {
        auto const node = generator.expression(sample, 5);
        auto const text = textOf(*node);
        Selected const expected = oracle.evaluate(*node);
        expectSelected(*node, text, *geometry, expected);
        // The dump has fewer parentheses and the same tree.
        expectSelected(*node, trees::dumpOf(*trees::parseTagExpression(text)), *geometry, expected);
    }
    for (std::size_t i = 0; i < stored.size(); ++i) {
        EXPECT_EQ(support::arrayIn<bool>(*geometry, sample.tags[i].name.c_str()), stored[i]);
        EXPECT_EQ(flagsOf(stored[i]), sample.tags[i].flags);
    }
}

TEST(GeneratedExpressions, SelectWhatTheOracleSelectsOnAnyNumberOfThreads)
{
    support::onThreadCounts([] {
        for (unsigned int seed = 0; seed < 40; ++seed)
            checkExpressions(seed, 12, 15);
        checkExpressions(1000, 150'000, 3);
    });
}

TEST(GeneratedExpressions, DeepOnesOfManyTasksSelectWhatTheOracleSelects)
{
    Generator generator(5);
    TagSample const sample = generator.sample(9);
    Oracle const oracle(sample);
    auto const geometry = sample.build();
    auto const leaf = [&] { return generator.expression(sample, 2); };
    NodePtr chain = leaf();
    NodePtr nest = leaf();
    for (int i = 0; i < 400; ++i) {
        chain = std::make_shared<Node>(Node{"+-^"[i % 3], "", chain, leaf()});
        nest = std::make_shared<Node>(
            Node{"^+-"[i % 3], "", leaf(), i % 5 != 0 ? nest : std::make_shared<Node>(Node{'!', "", nest, nullptr})});
    }
    for (auto const& node : {chain, nest})
        expectSelected(*node, trees::dumpOf(*trees::parseTagExpression(textOf(*node))), *geometry,
                       oracle.evaluate(*node));
}

} // namespace
