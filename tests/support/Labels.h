#pragma once

#include <algorithm>
#include <numeric>
#include <utility>
#include <vector>

namespace support {

using Pairs = std::vector<std::pair<unsigned int, unsigned int>>;

/// The least element of each element's set, of sets joined by pairs: labels are lowered along the pairs until nothing
/// changes.
inline std::vector<unsigned int> leastLabels(unsigned int count, Pairs const& pairs)
{
    std::vector<unsigned int> labels(count);
    std::iota(labels.begin(), labels.end(), 0u);
    for (bool isChanged = true; isChanged;) {
        isChanged = false;
        for (auto const& [a, b] : pairs)
            if (labels[a] != labels[b]) {
                labels[a] = labels[b] = std::min(labels[a], labels[b]);
                isChanged = true;
            }
    }
    return labels;
}

} // namespace support
