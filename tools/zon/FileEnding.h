#pragma once

#include <algorithm>
#include <filesystem>
#include <string>

namespace Zon {

/// The ending of a file's name in small letters, with its dot: "a/B.OBJ" has ".obj". By it formats are told apart.
[[nodiscard]] inline std::string fileEnding(std::string const& path)
{
    auto ending = std::filesystem::path(path).extension().string();
    std::transform(ending.begin(), ending.end(), ending.begin(), [](char c) {
        bool const isCapital = c >= 'A' && c <= 'Z';
        return isCapital ? static_cast<char>(c - 'A' + 'a') : static_cast<unsigned char>(c) < 128 ? c : '?';
    });
    return ending;
}

} // namespace Zon
