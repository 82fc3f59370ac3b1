#pragma once

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>
#include <vld/Component.h>

#include <cstdint>
#include <utility>

namespace Veldrin::Geometry {

/// A topology of the volume library as a component geo property: "count" is its number of elements, over all levels.
///
/// Refuses all writes: extracting gives an empty value, erasing and setting give false, erasing everything does nothing.
/// A point topology is held like any other, but has no "count": it is no component of a geometry.
/// Copies share the topology. Cost: constant. Threads: as of any object.
class VELDRIN_API VldProxyComponentTopology final : public Object {
public:
    explicit VldProxyComponentTopology(Nexil::Ptr<VLD::Component> component) noexcept : component_(std::move(component))
    {
    }
    VldProxyComponentTopology(VldProxyComponentTopology const&);
    VldProxyComponentTopology& operator=(VldProxyComponentTopology const&);

    ~VldProxyComponentTopology() override;
    [[nodiscard]] std::uint64_t size() const override;
    [[nodiscard]] bool empty() const override;
    [[nodiscard]] bool hasProperty(Nexil::String const& key) const override;
    [[nodiscard]] Nexil::Any getProperty(Nexil::String const& key) const override;
    Nexil::Any extractProperty(Nexil::String const& key) override;
    bool eraseProperty(Nexil::String const& key) override;
    void eraseAllProperties() override;
    [[nodiscard]] Nexil::Array<Nexil::String> keys() const override;
    bool setPropertyAny(Nexil::String const& key, Nexil::Any&& value) override;
    [[nodiscard]] PropertyInfo propertyInfo(Nexil::String const& key) const override;

    [[nodiscard]] Nexil::Ptr<VLD::Component> getVldComponent() const { return component_; }

private:
    Nexil::Ptr<VLD::Component> component_;
};

} // namespace Veldrin::Geometry
