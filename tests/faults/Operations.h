#pragma once

#include <nexil/Ptr.h>
#include <veldrin/object/Object.h>
#include <vld/Object.h>

#include <functional>
#include <string>
#include <vector>

/// Every exported function as something that can be run again and again on geometry that must not change.
namespace support {

/// What the operations read.
struct Sample {
    Sample();

    /// Faces and strands over a few points, with selections of all components and values shared out by a range.
    Nexil::Ptr<Veldrin::Object> geometry;
    /// For so many elements the arrays have room that algorithms are to fill.
    std::uint64_t room = 0;
    /// Level sets of a small ball as geometry, in both configurations.
    Nexil::Ptr<Veldrin::Object> smallVolume;
    Nexil::Ptr<Veldrin::Object> wideVolume;
    /// All of them as a stream.
    std::string stream;

    /// Everything that can be seen of it.
    [[nodiscard]] std::string description() const;
};

/// What an operation may be run on besides a sample as it was made: any volumes, a geometry of any numbers at all, or of
/// element counts that are not huge, where outputs are as large as these say.
enum class Takes { Sample, Volumes, SmallCounts, Anything };

struct Operation {
    char const* name;
    /// Runs it and tells whether the function says that it succeeded. Whatever it allocates it gives back. Outputs that are
    /// left neither as before nor empty, when it throws, and answers that contradict each other are told by
    /// std::logic_error.
    std::function<bool(Sample const&)> run;
    Takes takes = Takes::Sample;
};

/// Those that go over all elements of a mesh or of strands, one function each. What finds no whole geometry to work on is no
/// success.
[[nodiscard]] std::vector<Operation> const& algorithms();

/// All, the algorithms first.
[[nodiscard]] std::vector<Operation> const& operations();

} // namespace support
