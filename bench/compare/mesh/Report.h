#pragma once

#include "Side.h"

#include <string>
#include <vector>

namespace compare {

/// Times of one kernel on one mesh, in nanoseconds a face, and whether all sides came to the same.
struct Row {
    Kernel kernel{};
    std::string order;
    double copy = 0;
    double flat = 0;
    double ours[2] = {0, 0}; ///< on one thread, on two
    double peer = 0;         ///< the quickest one
    std::string peerName;
    bool isEqual = false;
};

/// Measures the kernels whose names contain `only` on a mesh: all sides in turn, several times over, and the least time of
/// each counts.
[[nodiscard]] std::vector<Row> measure(PlainMesh const& mesh, std::string const& only, bool withPeers);

/// The rows of one mesh as a table in Markdown.
void print(std::string const& meshName, std::vector<Row> const& rows);

} // namespace compare
