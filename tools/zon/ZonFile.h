#pragma once

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/RuntimeMessage.h>
#include <veldrin/object/Object.h>

#include <cstdint>
#include <map>
#include <string>

/// Reading and writing whole zon files for the subcommands.
namespace Zon {

using Objects = Nexil::Array<Nexil::Ptr<Veldrin::Object>>;

/// Keeps the library's message of a failure and passes its warnings on.
class Messages : public Nexil::RuntimeServices {
public:
    void logMessage(Nexil::RuntimeMessage message) const override;
    /// The last error; a text of its own when there was none.
    [[nodiscard]] std::string errorText() const;

private:
    mutable std::string error_;
};

struct ZonHeader {
    unsigned int version = 0;
    int level = 0;
    bool hasHandles = false;
    std::uint64_t fileSize = 0;
};

/// Errors: Failure when the file cannot be opened or is no zon stream.
[[nodiscard]] ZonHeader readZonHeader(std::string const& path);

/// Errors: Failure with the library's message.
[[nodiscard]] Objects readZon(std::string const& path);

/// Writes beside the target and renames. Errors: Failure; the target is as before then.
void writeZon(Objects const& objects, std::string const& path, int level);

/// Writes changed objects of the file `input` to `output`, or in place of them when `output` is "", at the level that the
/// file has; warns when it had handles. Errors: as for `writeZon`.
void rewriteZon(Objects const& objects, std::string const& input, std::string const& output);

/// Calls edit(number, object) for each object that is not null; one that stands in the list twice is edited once and stays
/// one object. An object may be replaced by an edited copy of its own.
template <class Edit>
void editEach(Objects& objects, Edit const& edit)
{
    std::map<Veldrin::Object const*, Nexil::Ptr<Veldrin::Object>> edited;
    // Keeps what was read, so that no edited copy takes the address of another object.
    auto const given = objects;
    for (std::uint64_t i = 0; i < objects.size(); ++i) {
        if (!given[i])
            continue;
        auto const [place, isNew] = edited.try_emplace(given[i].get(), nullptr);
        if (isNew) {
            edit(i, objects[i]);
            place->second = objects[i];
        }
        objects[i] = place->second;
    }
}

/// Bytes that a stream of these objects takes at this level, without writing one.
[[nodiscard]] std::uint64_t streamSize(Objects const& objects, int level);

} // namespace Zon
