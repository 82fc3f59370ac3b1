/// Any bytes to the stream reader. What it takes is dumped, written, read again and compared.

#include "StreamRepair.h"

#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <veldrin/geometry/DebugDump.h>

#include <cstdint>
#include <cstdlib>
#include <unordered_map>

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t maxSize);

namespace {

using ObjectPtr = Nexil::Ptr<Veldrin::Object>;

constexpr std::uint64_t kMostDumped = 20000;

/// Number of objects that a dump would show, which follows every path: an object met twice is shown twice.
std::uint64_t shownObjects(ObjectPtr const& object, std::unordered_map<void const*, std::uint64_t>& known)
{
    if (!object)
        return 1;
    auto const [place, isNew] = known.try_emplace(object.get(), 0);
    if (!isNew)
        return place->second;
    std::uint64_t count = 1;
    for (auto const& key : object->keys()) {
        auto const value = object->getProperty(key);
        if (auto const* held = value.get<ObjectPtr>())
            count += shownObjects(*held, known);
        if (auto const* list = value.get<Nexil::Ptr<Nexil::Array<ObjectPtr>>>(); list && *list)
            for (auto const& element : **list)
                count = std::min(kMostDumped + 1, count + shownObjects(element, known));
    }
    return known[object.get()] = std::min(kMostDumped + 1, count);
}

class Discard : public Veldrin::Geometry::Internal::DebugDumpInterface {
public:
    void write(char const*, std::uint64_t) override {}
};

void check(bool condition)
{
    if (!condition)
        std::abort();
}

} // namespace

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* data, std::size_t size, std::size_t maxSize,
                                               unsigned int seed)
{
    size = LLVMFuzzerMutate(data, size, maxSize);
    // Most mutants carry right checksums, so that what lies behind the check is reached; some do not.
    if (seed % 8 != 0)
        fuzz::repairMarks(data, size);
    return size;
}

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    auto const first = support::read(std::string(reinterpret_cast<char const*>(data), size));
    check(first.isRead ? first.errors.empty() : first.errors.size() <= 1 && first.objects.empty());
    if (!first.isRead)
        return 0;

    Discard sink;
    std::unordered_map<void const*, std::uint64_t> known;
    for (auto const& object : first.objects)
        if (object && shownObjects(object, known) <= kMostDumped)
            Veldrin::Geometry::Internal::debugDumpToStream(sink, *object, 3);

    std::string const description = support::describeObjects(first.objects);
    for (int const level : {0, 9}) {
        auto const again = support::read(support::written(first.objects, level));
        check(again.isRead);
        check(support::describeObjects(again.objects) == description);
    }
    return 0;
}
