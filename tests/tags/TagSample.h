#pragma once

#include <support/Geometry.h>

#include <string>
#include <vector>

/// A geometry with tags, as plain values: what the tests build objects from and what the oracle reads.
struct TagSample {
    struct Tag {
        std::string name;
        std::string component;
        std::string flags;    ///< '0' and '1'
        std::string sameAs{}; ///< the earlier tag whose mask it shares
    };

    std::size_t pointCount = 0;
    support::Polygons faces;
    std::vector<unsigned int> strandSizes;
    std::vector<Tag> tags;

    [[nodiscard]] Nexil::MutablePtr<Veldrin::Object> build() const;
};

/// A cube, its points shared out among three strands, with tags of one letter, of all components, one too short and one of
/// none.
[[nodiscard]] TagSample const& taggedCube();

using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;

inline MaskPtr maskOf(std::string const& flags)
{
    Nexil::Array<bool> mask;
    mask.resize(flags.size());
    for (std::size_t i = 0; i < flags.size(); ++i)
        mask[i] = flags[i] == '1';
    return Nexil::makePtr<Nexil::Array<bool>>(std::move(mask));
}

inline std::string flagsOf(MaskPtr const& mask)
{
    std::string flags;
    for (bool const flag : *mask)
        flags += flag ? '1' : '0';
    return flags;
}
