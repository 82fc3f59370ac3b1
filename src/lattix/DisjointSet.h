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
    template <bool isAlone>
    class Parents;

    /// Every element a set of its own. Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
    explicit DisjointSet(std::uint64_t elementCount);

    [[nodiscard]] std::uint64_t size() const noexcept { return parents_.size(); }

    /// The least element of the set that `element`, below size(), belongs to.
    [[nodiscard]] Index find(Index element) noexcept { return parents().find(element); }

    /// Makes the sets of two elements, both below size(), one.
    void unite(Index a, Index b) noexcept
    {
        std::uint64_t linkCount = 0;
        parents().unite(a, b, linkCount);
    }

    /// The same operations and some more, for loops: of many threads, or of one that is alone with the set.
    [[nodiscard]] Parents<false> parents() noexcept { return Parents<false>(parents_.data()); }
    [[nodiscard]] Parents<true> parentsOfOneThread() noexcept { return Parents<true>(parents_.data()); }

    /// The least element of each set, in increasing order; as many as there are sets. In parallel, by ranges of 4096.
    /// No other thread may be uniting. Errors: std::bad_alloc; std::runtime_error when the job is cancelled.
    [[nodiscard]] Nexil::Array<Index> TBBGetRoots() const;

    /// The number of sets. Threads and errors as of `TBBGetRoots`.
    [[nodiscard]] std::uint64_t rootCount() const;

private:
    Nexil::Array<Index> parents_;
};

/// The parents of all elements, by their address alone: copied into a loop, it stays in a register. Elements are below the
/// set's size; the set has to live.
template <class Index>
template <bool isAlone>
class DisjointSet<Index>::Parents {
public:
    explicit Parents(Index* parents) noexcept : parents_(parents) {}

    /// What an element hangs under, or itself where it is a root. Two that hang under one parent are in one set: a quick
    /// question to ask first where that holds for most pairs.
    [[nodiscard]] Index operator[](Index element) const noexcept { return at(element).load(std::memory_order_relaxed); }

    /// Has the parent of an element brought to the cache, for calls that soon need it. Any number may be given.
    void prefetch(Index element) const noexcept
    {
        __builtin_prefetch(reinterpret_cast<void const*>(reinterpret_cast<std::uintptr_t>(parents_) +
                                                         std::uintptr_t(element) * sizeof(Index)));
    }

    [[nodiscard]] Index find(Index element) const noexcept
    {
        for (;;) {
            Index const parent = (*this)[element];
            if (parent == element)
                return element;
            Index const grandparent = (*this)[parent];
            // Who is alone rather stores what is there already than mispredicts the branch; for others the store would take
            // the cache line away.
            if (!isAlone && grandparent == parent)
                return parent;
            // A store that comes late sets an older ancestor: the path gets longer again, and stays right.
            at(element).store(grandparent, std::memory_order_relaxed);
            element = grandparent;
        }
    }

    /// Adds one to `linkCount` when there were two sets. Returns the root: handed to the next call in the place of `a`, it
    /// saves the way there.
    Index unite(Index a, Index b, std::uint64_t& linkCount) const noexcept
    {
        for (;;) {
            a = find(a);
            b = find(b);
            if (a == b)
                return a;
            Index const root = std::min(a, b);
            Index expected = std::max(a, b);
            if (at(expected).compare_exchange_weak(expected, root, std::memory_order_relaxed)) {
                ++linkCount;
                return root;
            }
        }
    }

    /// The same with a plain store, several times cheaper than the locked one.
    ///
    /// Two threads that link the same root at once lose one of the unions. They know it afterwards: no union was lost if
    /// there have been size() - rootCount() links since the set was made. Otherwise `unite` has to be called for all pairs
    /// once more, which brings back what was lost. No thread may call `unite` beside this.
    Index uniteLoosely(Index a, Index b, std::uint64_t& linkCount) const noexcept
    {
        a = find(a);
        b = find(b);
        if (a == b)
            return a;
        Index const root = std::min(a, b);
        at(std::max(a, b)).store(root, std::memory_order_relaxed);
        ++linkCount;
        return root;
    }

private:
    [[nodiscard]] std::atomic_ref<Index> at(Index element) const noexcept
    {
        return std::atomic_ref<Index>(parents_[element]);
    }

    Index* parents_;
};

extern template class DisjointSet<unsigned int>;

} // namespace Lattix
