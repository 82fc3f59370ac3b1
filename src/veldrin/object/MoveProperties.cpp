#include <veldrin/object/Properties.h>

#include <optional>
#include <vector>

namespace Veldrin {

namespace {

    /// What stood under some names of an object.
    class Replaced {
    public:
        /// Everything that needs memory happens here.
        Replaced(Object const& object, Nexil::Array<Nexil::String> const& names) : names_(names)
        {
            values_.reserve(names.size());
            for (Nexil::String const& name : names)
                values_.push_back(object.hasProperty(name) ? std::optional(object.getProperty(name)) : std::nullopt);
        }

        /// Brings back the first `count`.
        void restore(Object& object, std::uint64_t count)
        {
            while (count-- > 0)
                if (auto& value = values_[count])
                    object.setPropertyAny(names_[count], std::move(*value));
                else
                    object.eraseProperty(names_[count]);
        }

    private:
        Nexil::Array<Nexil::String> const& names_;
        std::vector<std::optional<Nexil::Any>> values_;
    };

} // namespace

bool moveProperties(Object& from, Object& to)
{
    auto const names = from.keys();
    Replaced replaced(to, names);
    std::uint64_t moved = 0;
    try {
        while (moved < names.size() && to.setPropertyAny(names[moved], from.extractProperty(names[moved])))
            ++moved;
    } catch (...) {
        replaced.restore(to, moved);
        throw;
    }
    bool const isWhole = moved == names.size();
    if (!isWhole)
        replaced.restore(to, moved);
    return isWhole;
}

} // namespace Veldrin
