#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <type_traits>

/// Which of n elements belong together, told pair by pair.
///
///     Lattix::DisjointSet<unsigned int> sets(5);
///     sets.unite(3, 1);
///     sets.unite(4, 3);
///     sets.find(4);       // 1
///     sets.TBBGetRoots(); // 0, 1, 2
namespace Lattix {

/// A forest over the indices [0, n): elements of one tree are one set, and its root is the least of them.
///
/// Index:   an unsigned type that holds n - 1; the library is built for `unsigned int`.
/// Memory:  one Index an element.
/// Cost:    `unite` and `find` are close to constant on average. Threads: both may be called by many threads at once;
///          which sets come out, and their roots, do not depend on the order of calls.
///
/// Unions are lock-free and link the larger root under the smaller; paths are halved on the way (Robert E. Tarjan and Jan
/// van Leeuwen, "Worst-case analysis of set union algorithms", 1984; Richard J. Anderson and Heather Woll, "Wait-free
/// parallel algorithms for the union-find problem", 1991).
template <class Index>
class VELDRIN_PLATFORM_API DisjointSet {
    static_assert(std::is_unsigned_v<Index>);

public:
    /// Every element a set of its own. Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
    explicit DisjointSet(std::uint64_t elementCount);

    [[nodiscard]] std::uint64_t size() const noexcept { return parents_.size(); }

    /// The least element of the set that `element`, below size(), belongs to.
    [[nodiscard]] Index find(Index element) noexcept
    {
        Index parent = load(element);
        while (parent != element) {
            Index const grandparent = load(parent);
            if (grandparent == parent)
                return parent;
            // A store that comes late sets an older ancestor: the path gets longer again, and stays right.
            parentOf(element).store(grandparent, std::memory_order_relaxed);
            element = grandparent;
            parent = load(element);
        }
        return element;
    }

    /// Makes the sets of two elements, both below size(), one.
    void unite(Index a, Index b) noexcept
    {
        for (;;) {
            a = find(a);
            b = find(b);
            if (a == b)
                return;
            Index expected = std::max(a, b);
            if (parentOf(expected).compare_exchange_weak(expected, std::min(a, b), std::memory_order_relaxed))
                return;
        }
    }

    /// Makes two sets one with a plain store, several times cheaper than the locked one of `unite`, and calls
    /// onLink(root, lesserRoot) when they were two. Returns an element at or near the root: handed to the next call in the
    /// place of `a`, it saves the way there.
    ///
    /// Two threads that link the same root at once lose one of the unions. They know it afterwards: no union was lost if
    /// there have been size() - rootCount() links since the set was made. Otherwise `unite` has to be called for each pair
    /// that onLink was told, which brings back what was lost. No thread may call `unite` beside this.
    template <class OnLink>
    Index uniteLoosely(Index a, Index b, OnLink const& onLink) noexcept(noexcept(onLink(a, b)))
    {
        // Most pairs of a mesh hang together already, under one parent.
        Index const parent = load(a);
        if (parent == load(b))
            return parent;
        a = find(parent);
        b = find(b);
        if (a == b)
            return a;
        Index const root = std::min(a, b);
        Index const linked = std::max(a, b);
        onLink(linked, root);
        parentOf(linked).store(root, std::memory_order_relaxed);
        return root;
    }

    /// The least element of each set, in increasing order; as many as there are sets. In parallel, by ranges of 4096.
    /// No other thread may be uniting. Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
    [[nodiscard]] Nexil::Array<Index> TBBGetRoots() const;

    /// The number of sets. Threads and errors as of `TBBGetRoots`.
    [[nodiscard]] std::uint64_t rootCount() const;

private:
    [[nodiscard]] std::atomic_ref<Index> parentOf(Index element) noexcept
    {
        return std::atomic_ref<Index>(parents_.data()[element]);
    }
    [[nodiscard]] Index load(Index element) noexcept { return parentOf(element).load(std::memory_order_relaxed); }

    Nexil::Array<Index> parents_;
};

extern template class DisjointSet<unsigned int>;

} // namespace Lattix
