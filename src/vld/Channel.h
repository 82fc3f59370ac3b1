#pragma once

#include <nexil/Any.h>
#include <nexil/Array.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <nexil/TypeId.h>
#include <vld/Component.h>
#include <vld/DataElementInitializerType.h>
#include <vld/Traits.h>

#include <cstdint>
#include <span>
#include <type_traits>
#include <utility>

namespace VLD::TileTree3D {

/// One value per element of a topology, in one shared array, tile after tile.
///
/// The element type is any plain type; it is known by the array, not by the class.
/// Copying a channel shares the array. Threads: reading is safe from any number of them; a writer must be alone.
class VELDRIN_PLATFORM_API ChannelBase : public Component {
public:
    ~ChannelBase() override;

    /// Name of the container, or the point topology, that the channel belongs to.
    [[nodiscard]] Nexil::String const& containerName() const noexcept { return containerName_; }
    void setContainerName(Nexil::String name) noexcept { containerName_ = std::move(name); }

    /// The configuration whose tiles the channel follows.
    [[nodiscard]] TileParameters const& tileParameters() const noexcept { return parameters_; }

    /// Number of values.
    [[nodiscard]] std::uint64_t elementCount() const noexcept { return Nexil::AnyArray::get_any_array_size(data_); }
    /// Type of a value.
    [[nodiscard]] Nexil::TypeId elementType() const noexcept { return defaultValue_.type(); }
    /// The values as a `Ptr<Array<E>>` for the element type E; never null.
    [[nodiscard]] Nexil::Any const& data() const noexcept { return data_; }
    /// What voxels outside all tiles have; of the element type.
    [[nodiscard]] Nexil::Any const& defaultValue() const noexcept { return defaultValue_; }
    [[nodiscard]] DataElementInitializerType initializer() const noexcept { return initializer_; }

    /// The values when they are exactly of type E, else null. Shares the array.
    template <class E>
    [[nodiscard]] Nexil::Ptr<Nexil::Array<E>> values() const
    {
        auto const* array = data_.get<Nexil::Ptr<Nexil::Array<E>>>();
        return array ? *array : nullptr;
    }

    /// The values for writing; no values when they are not exactly of type E. Copies the array first when somebody else
    /// holds it.
    template <class E>
    [[nodiscard]] std::span<E> writeValues()
    {
        auto* const array = data_.get<Nexil::Ptr<Nexil::Array<E>>>();
        if (!array)
            return {};
        Nexil::MutablePtr<Nexil::Array<E>> own(std::move(*array));
        std::span<E> const values(own->data(), own->size());
        *array = std::move(own);
        return values;
    }

    /// Replaces the values: a `Ptr<Array<E>>` of the same element type and size as now. False, and nothing changed, for
    /// anything else, null included.
    bool setData(Nexil::Any data);
    [[nodiscard]] bool acceptsData(Nexil::Any const& data) const noexcept;
    /// Replaces the default; false, and nothing changed, for a value of another type.
    bool setDefaultValue(Nexil::Any value);
    [[nodiscard]] bool acceptsDefaultValue(Nexil::Any const& value) const noexcept
    {
        return value.type() == elementType();
    }
    void setInitializer(DataElementInitializerType initializer) noexcept { initializer_ = initializer; }

protected:
    ChannelBase(Nexil::String name, Nexil::String containerName, TileParameters const& parameters, Nexil::Any data,
                Nexil::Any defaultValue, DataElementInitializerType initializer) noexcept;
    ChannelBase(ChannelBase const&);

private:
    Nexil::String containerName_;
    Nexil::Any data_;
    Nexil::Any defaultValue_;
    TileParameters parameters_;
    DataElementInitializerType initializer_;
};

/// A channel that follows the tiles of one configuration.
template <class Traits>
class VELDRIN_PLATFORM_API Channel final : public ChannelBase {
public:
    /// data: one value per element of the container's topology; which nothing here checks. Null counts as empty.
    template <class E>
        requires std::is_trivially_copyable_v<E>
    Channel(Nexil::String name, Nexil::String containerName, Nexil::Ptr<Nexil::Array<E>> data,
            std::type_identity_t<E> const& defaultValue,
            DataElementInitializerType initializer = DataElementInitializerType::Linear)
        : ChannelBase(std::move(name), std::move(containerName), Traits::parameters(),
                      data ? std::move(data) : Nexil::makePtr<Nexil::Array<E>>(), defaultValue, initializer)
    {
    }
    ~Channel() override;
    Channel(Channel const&);
};

extern template class Channel<SmallTiles>;
extern template class Channel<WideTiles>;

} // namespace VLD::TileTree3D
