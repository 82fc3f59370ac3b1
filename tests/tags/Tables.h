#pragma once

#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

/// Tables of tests as text files.
namespace tables {

/// The lines of a file of the corpus, without empty ones and those that begin with '#'.
inline std::vector<std::string> lines(std::string const& name)
{
    std::ifstream file(VELDRIN_TEST_CORPUS "/tags/" + name);
    std::vector<std::string> found;
    for (std::string line; std::getline(file, line);)
        if (!line.empty() && line[0] != '#')
            found.push_back(line);
    if (found.empty())
        throw std::runtime_error("no table " + name);
    return found;
}

/// A text with its escapes \0, \t, \n, \v, \f, \r and \xHH taken for what they mean.
inline std::string unescaped(std::string const& text)
{
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '\\') {
            result += text[i];
        } else if (text[++i] == 'x') {
            result += static_cast<char>(std::stoi(text.substr(i + 1, 2), nullptr, 16));
            i += 2;
        } else {
            std::string const names = "0tnvfr";
            result += std::string("\0\t\n\v\f\r", 6).at(names.find(text[i]));
        }
    }
    return result;
}

} // namespace tables
