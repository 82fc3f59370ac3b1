#include "Tracked.h"

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/Ptr.h>

#include <gmock/gmock.h>

#include <barrier>
#include <numeric>
#include <string>
#include <thread>
#include <vector>

namespace {

using Nexil::makePtr;
using Nexil::MutablePtr;
using Nexil::Ptr;
using support::Tracked;

struct Left {
    virtual ~Left() = default;
    int left = 1;
};

struct Right {
    virtual ~Right() = default;
    int right = 2;
};

struct alignas(64) Both : Left, Right {
    std::string text = "a text that is too long to be held without the heap";
};

TEST(Ptr, AWriterTakesOverWhatNobodySharesAndCopiesTheRest)
{
    EXPECT_FALSE(MutablePtr<Tracked>(Ptr<Tracked>()));
    {
        Ptr<Tracked> first = makePtr<Tracked>(7);
        auto const* const address = first.get();
        MutablePtr<Tracked> own(std::move(first));
        EXPECT_EQ(own.get(), address);
        EXPECT_FALSE(first);
        own->value = 8;
        first = std::move(own);
        EXPECT_EQ(first.get(), address);
        Ptr<Tracked> const second = first;
        own = MutablePtr<Tracked>(std::move(first));
        EXPECT_NE(own.get(), address);
        EXPECT_FALSE(first);
        own->value = 9;
        EXPECT_EQ(second->value, 8);
        EXPECT_EQ(second.useCount(), 1u);
        EXPECT_EQ(Tracked::alive, 2);
    }
    EXPECT_EQ(Tracked::alive, 0);
}

TEST(Ptr, APointerToABaseCopiesTheWholeObject)
{
    auto made = Nexil::makeMutable<Both>();
    made->left = 10;
    made->right = 20;
    Ptr<Right> shared(std::move(made)); // not at the start of the object
    Ptr<Right> const other = shared;
    MutablePtr<Right> own(std::move(shared));
    own->right = 21;
    EXPECT_EQ(other->right, 20);
    auto* const whole = dynamic_cast<Both*>(own.get());
    ASSERT_TRUE(whole);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(whole) % alignof(Both), 0u);
    EXPECT_EQ(whole->left, 10);
    EXPECT_EQ(whole->text, Both().text);
}

TEST(Ptr, ConvertsToBasesAndOnlyWritersBecomeReadersByThemselves)
{
    static_assert(!std::is_convertible_v<Ptr<Right>, Ptr<Both>>);
    static_assert(!std::is_convertible_v<Ptr<Both>, MutablePtr<Both>>);
    static_assert(!std::is_constructible_v<MutablePtr<Both>, Ptr<Both> const&>);

    Ptr<Both> both = makePtr<Both>();
    Ptr<Right> right = both;
    Ptr<Right> const moved = std::move(both);
    auto& self = right;
    right = self;
    right = std::move(self);
    EXPECT_TRUE(both == nullptr && moved == right && moved.useCount() == 2u);
    // A null pointer stays null although the base lies further inside.
    EXPECT_EQ(Ptr<Right>(Ptr<Both>()).get(), nullptr);
    EXPECT_EQ(MutablePtr<Right>(MutablePtr<Both>()).get(), nullptr);
}

struct Node {
    static inline int alive = 0;

    Ptr<Node> next;
    Ptr<Nexil::Array<Ptr<Node>>> list;
    Nexil::Any any;

    Node() { ++alive; }
    Node(Node const& other) : next(other.next), list(other.list), any(other.any) { ++alive; }
    ~Node() { --alive; }
};

TEST(Ptr, AMillionNodesInARowAreDestroyedWithoutAMillionStackFrames)
{
    constexpr int nodeCount = 1'000'000;
    Ptr<Node> head;
    for (int i = 0; i < nodeCount; ++i) {
        auto node = Nexil::makeMutable<Node>();
        if (i % 3 == 0)
            node->next = std::move(head);
        else if (i % 3 == 1)
            node->list = makePtr<Nexil::Array<Ptr<Node>>>(std::initializer_list<Ptr<Node>>{head, nullptr});
        else
            node->any = head;
        head = std::move(node);
    }
    EXPECT_EQ(Node::alive, nodeCount);
    for (int i = 0; i < 3; ++i) // the step a list walker takes: from the value into the pointer that holds it
        head = head->next ? head->next : head->list ? (*head->list)[0] : *head->any.get<Ptr<Node>>();
    EXPECT_EQ(Node::alive, nodeCount - 3);
    head.reset();
    EXPECT_EQ(Node::alive, 0);
}

constexpr std::size_t kThreadCount = 4;
constexpr int kRoundCount = 500;

template <class Body>
void onAllThreads(Body const& body)
{
    std::vector<std::jthread> threads;
    for (std::size_t t = 0; t < kThreadCount; ++t)
        threads.emplace_back([&body, t] { body(t); });
}

/// Reads, when it is destroyed, what each holder wrote before it let go: a race unless the last drop sees all others.
struct Witness {
    std::vector<int> const* notes;
    int* sum;

    Witness(std::vector<int> const* n, int* s) : notes(n), sum(s) {}
    ~Witness() { *sum += std::accumulate(notes->begin(), notes->end(), 0); }
};

TEST(Ptr, TheLastOfManyHoldersDestroysOnceAndSeesWhatTheOthersDid)
{
    for (int round = 0; round < kRoundCount; ++round) {
        std::vector<int> notes(kThreadCount);
        int sum = 0;
        std::vector<Ptr<Witness>> held(kThreadCount, Nexil::makePtr<Witness>(&notes, &sum));
        onAllThreads([&](std::size_t t) {
            for (int i = 0; i < 20; ++i)
                std::vector<Ptr<Witness>> const copies(5, held[t]);
            notes[t] = 1;
            held[t].reset();
        });
        ASSERT_EQ(sum, static_cast<int>(kThreadCount));
    }
}

TEST(Ptr, WritersThatEachHoldACopyDoNotSeeEachOther)
{
    using Numbers = Nexil::Array<int>;
    constexpr int kNumberCount = 100;
    std::vector<Ptr<Numbers>> held(kThreadCount);
    std::barrier turn(kThreadCount);
    onAllThreads([&](std::size_t t) {
        for (int round = 0; round < kRoundCount; ++round) {
            if (t == 0) {
                auto fresh = Nexil::makeMutable<Numbers>();
                fresh->resize(kNumberCount);
                std::ranges::fill(*fresh, round);
                Ptr<Numbers> const shared(std::move(fresh));
                std::ranges::fill(held, shared);
            }
            turn.arrive_and_wait();
            // The last one takes the original over, and may write to it only when the others have made their copies.
            MutablePtr<Numbers> own(std::move(held[t]));
            EXPECT_EQ(std::ranges::count(*own, round), kNumberCount);
            std::ranges::fill(*own, -1 - static_cast<int>(t));
            held[t] = std::move(own);
            turn.arrive_and_wait();
            EXPECT_EQ(std::ranges::count(*held[t], -1 - static_cast<int>(t)), kNumberCount);
            turn.arrive_and_wait();
        }
    });
}

} // namespace
