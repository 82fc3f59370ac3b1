#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <vld/Component.h>

#include <cstdint>
#include <map>

/// A volume: named components of sparse voxel trees.
///
///     auto volume = VLD::createObject();
///     volume->addComponent(topology);
///     volume->addComponent(container);
///     volume->addComponent(density);
///     auto read = volume->component<VLD::TileTree3D::ChannelBase>("voxel_fog_density");
namespace VLD {

/// Components in the order in which they were added, found by name.
///
/// Copying an object shares its components. Cost: logarithmic lookups; nothing here depends on the number of voxels.
/// Threads: reading from many at once is safe; a writer must be alone.
class VELDRIN_PLATFORM_API Object {
public:
    /// Names of all components, oldest first.
    [[nodiscard]] Nexil::Array<Nexil::String> componentRange() const;

    /// The component of that name when it is a `Kind`, which may be any class derived from `Component`; null otherwise.
    template <class Kind>
    [[nodiscard]] Nexil::Ptr<Kind> component(Nexil::String const& name) const
    {
        return Nexil::dynamicPtrCast<Kind>(find(name));
    }

    [[nodiscard]] bool hasComponentFromName(Nexil::String const& name) const;
    [[nodiscard]] bool empty() const noexcept { return components_.empty(); }
    [[nodiscard]] std::uint64_t componentCount() const noexcept { return components_.size(); }

    /// Adds a component under its own name. False, and nothing added, for null, for an empty name, and where a component
    /// of that name is there already.
    bool addComponent(Nexil::Ptr<Component> component);

    void clear() noexcept;

private:
    [[nodiscard]] Nexil::Ptr<Component> find(Nexil::String const& name) const;

    Nexil::Array<Nexil::Ptr<Component>> components_;
    // From each name to its place among the components.
    std::map<Nexil::String, std::uint64_t> places_;
};

/// A new empty volume for one writer.
[[nodiscard]] VELDRIN_PLATFORM_API Nexil::MutablePtr<Object> createObject();

} // namespace VLD
