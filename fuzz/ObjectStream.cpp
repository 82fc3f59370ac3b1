/// Any bytes to the stream reader.

#include "StreamCheck.h"
#include "StreamRepair.h"

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t maxSize);

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
    fuzz::checkStream({reinterpret_cast<char const*>(data), size});
    return 0;
}
