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

/// A container of the volume library as a range geo property: "indices", "target" and "depends_on".
///
/// "indices" is 0, 1, 2, ...: channels hold one value per element. It is made when it is first read, once per topology;
/// asking for its type and size makes nothing. "depends_on" is empty.
/// "target" can be set, and the container, copied first when others hold it, refers to the topology of that name then.
/// All other writes are refused: extracting gives an empty value, erasing false, erasing everything does nothing.
/// Copies share the container. Cost: constant but for the first reading of "indices", which also throws std::runtime_error
/// when the job is cancelled. Threads: as of any object.
class VELDRIN_API VldProxyComponentContainer final : public Object {
public:
    explicit VldProxyComponentContainer(Nexil::Ptr<VLD::Component> component, Nexil::String target = {}) noexcept
        : component_(std::move(component)), target_(std::move(target))
    {
    }
    VldProxyComponentContainer(VldProxyComponentContainer const&);
    VldProxyComponentContainer& operator=(VldProxyComponentContainer const&);

    ~VldProxyComponentContainer() override;
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
    Nexil::String target_;
};

} // namespace Veldrin::Geometry
