/// Any bytes to the stream reader. What it takes is dumped, written, read again and compared.

#include <support/Geometry.h>
#include <support/StreamDescription.h>
#include <support/Streams.h>

#include <cstdint>
#include <cstdlib>

namespace {

void check(bool condition)
{
    if (!condition)
        std::abort();
}

void run(std::string const& bytes)
{
    auto const first = support::read(bytes);
    check(first.isRead ? first.errors.empty() : first.errors.size() <= 1 && first.objects.empty());
    if (!first.isRead)
        return;

    for (auto const& object : first.objects)
        if (object)
            (void)support::dump(*object, 3);
    std::string const description = support::describeObjects(first.objects);
    for (int const level : {0, 9}) {
        auto const again = support::read(support::written(first.objects, level));
        check(again.isRead);
        check(support::describeObjects(again.objects) == description);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* data, std::size_t size)
{
    std::string bytes(reinterpret_cast<char const*>(data), size);
    run(bytes);
    // Once more as version 5, which has no checksums, so that what lies behind them is reached.
    auto const version = bytes.find("file_version\x92\x02\x06");
    if (version != std::string::npos) {
        bytes[version + 14] = 5;
        run(bytes);
    }
    return 0;
}
