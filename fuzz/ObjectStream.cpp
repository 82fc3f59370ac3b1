/// Any bytes to the stream reader. What it takes is dumped, written, read again and compared.

#include "StreamRepair.h"

#include <support/Geometry.h>
#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <cstdint>
#include <cstdlib>

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t maxSize);

namespace {

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

    for (auto const& object : first.objects)
        if (object)
            (void)support::dump(*object, 3);
    std::string const description = support::describeObjects(first.objects);
    for (int const level : {0, 9}) {
        auto const again = support::read(support::written(first.objects, level));
        check(again.isRead);
        check(support::describeObjects(again.objects) == description);
    }
    return 0;
}
