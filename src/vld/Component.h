#pragma once

#include <nexil/Export.h>
#include <nexil/String.h>

#include <utility>

namespace VLD {

/// Whatever of the volume library has a name.
class VELDRIN_PLATFORM_API Base {
public:
    virtual ~Base();

    [[nodiscard]] Nexil::String const& name() const noexcept { return name_; }

protected:
    explicit Base(Nexil::String name) noexcept : name_(std::move(name)) {}
    Base(Base const&) = default;
    Base(Base&&) noexcept = default;
    Base& operator=(Base const&) = default;
    Base& operator=(Base&&) noexcept = default;

private:
    Nexil::String name_;
};

/// A part of a volume: a topology, a container or a channel. Copying a component shares its arrays.
class VELDRIN_PLATFORM_API Component : public Base {
public:
    ~Component() override;

protected:
    using Base::Base;
    Component(Component const&) = default;
    Component(Component&&) noexcept = default;
    Component& operator=(Component const&) = default;
    Component& operator=(Component&&) noexcept = default;
};

} // namespace VLD
