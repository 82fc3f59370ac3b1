#pragma once

#include <malloc.h>

#include <cstdint>
#include <fstream>
#include <string>

namespace bench {

/// The most memory that the program holds at once above what it held when this was made. Linux only; 0 elsewhere.
class PeakMemory {
public:
    PeakMemory()
    {
        malloc_trim(0);
        // 5 sets the peak back to what is held now.
        std::ofstream("/proc/self/clear_refs") << "5";
        start_ = kilobytes("VmHWM:");
    }

    [[nodiscard]] double bytes() const { return static_cast<double>(kilobytes("VmHWM:") - start_) * 1024; }

private:
    static std::int64_t kilobytes(std::string const& label)
    {
        std::ifstream status("/proc/self/status");
        for (std::string word; status >> word;)
            if (std::int64_t value = 0; word == label && status >> value)
                return value;
        return 0;
    }

    std::int64_t start_;
};

} // namespace bench
