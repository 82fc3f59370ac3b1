#pragma once

#include <openvdb/Exceptions.h>
#include <openvdb/Grid.h>
#include <openvdb/io/File.h>
#include <openvdb/io/GridDescriptor.h>

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// Opening files of OpenVDB in which some grids are of types that it does not know. Included where its headers are anyway.
namespace Zon {

/// Types of grids that nobody registered, registered as nothing while this lives: with one that is not, a file is not opened.
class VdbStandIns {
public:
    VdbStandIns() = default;
    VdbStandIns(VdbStandIns const&) = delete;
    VdbStandIns& operator=(VdbStandIns const&) = delete;
    ~VdbStandIns()
    {
        for (auto const& type : types_)
            Registry::unregisterGrid(type);
    }

    /// The type that an error complains of; nothing when it complains of something else.
    static std::optional<std::string> typeIn(openvdb::Exception const& error)
    {
        constexpr std::string_view kBefore = "rid type ", kBehind = " is not registered";
        std::string_view const text = error.what();
        auto const start = text.find(kBefore), end = text.rfind(kBehind);
        if (start == text.npos || end == text.npos || start + kBefore.size() > end)
            return std::nullopt;
        return std::string(text.substr(start + kBefore.size(), end - start - kBefore.size()));
    }

    /// False when nothing is to be done about the error.
    bool addFor(openvdb::Exception const& error)
    {
        auto const type = typeIn(error);
        // Each takes another look at the whole file.
        if (!type || types_.size() == kMostTypes)
            return false;
        Registry::registerGrid(*type, [] { return openvdb::GridBase::Ptr(); });
        types_.push_back(*type);
        return true;
    }

private:
    static constexpr std::size_t kMostTypes = 32;

    struct Registry : openvdb::GridBase {
        using GridBase::registerGrid;
        using GridBase::unregisterGrid;
    };

    std::vector<std::string> types_;
};

/// Opens a file, whatever grids are in it. `readGrid` throws KeyError for those of types that nobody registered; but a file
/// that has to be read from front to back is not opened when one of them is in it.
inline std::unique_ptr<openvdb::io::File> openVdb(std::string const& path)
{
    struct File : openvdb::io::File {
        using openvdb::io::File::File;
        using openvdb::io::File::inputHasGridOffsets;
    };
    VdbStandIns standIns;
    for (;;) {
        auto file = std::make_unique<File>(path);
        try {
            file->open(false);
            return file;
        } catch (openvdb::LookupError const& error) {
            // Without offsets, opening reads the grids as well.
            if (!file->inputHasGridOffsets() || !standIns.addFor(error))
                throw;
        }
    }
}

} // namespace Zon
