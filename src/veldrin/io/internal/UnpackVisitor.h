#pragma once

#include <nexil/Any.h>
#include <nexil/String.h>
#include <veldrin/io/internal/ChunkReader.h>
#include <veldrin/io/internal/ItemReader.h>
#include <veldrin/object/Object.h>
#include <veldrin/volume/internal/ProxyDescription.h>

#include <cstdint>

/// From unpacked MessagePack nodes to values. Failures are thrown as `Nexil::String` or as msgpack errors.
///
/// Each format generation builds on the one before and changes what it changed: version 2 brought null, version 3 kinds
/// of arrays and, for the versions that have them, references.
namespace Veldrin::IO {

namespace V1 {

    /// Values of version 1: everything inline, arrays without kinds, always compressed.
    class UnpackVisitor {
    public:
        explicit UnpackVisitor(ItemReader& item) : item_(item) {}
        UnpackVisitor(UnpackVisitor const&) = delete;
        UnpackVisitor& operator=(UnpackVisitor const&) = delete;
        virtual ~UnpackVisitor() = default;

        /// Reads [name, frame, name, frame, ...] into `object`.
        void unpackObject(msgpack::object const& node, Object& object);

        /// Reads a new object, which may be null where the version has null.
        [[nodiscard]] virtual Nexil::Ptr<Object> unpackObjectPointer(msgpack::object const& node);

        /// Reads the payload of `code`, which is below TypeCode::kCount.
        [[nodiscard]] Nexil::Any unpackPayload(unsigned int code, msgpack::object const& payload);

        /// Splits a frame [code, payload].
        [[nodiscard]] static unsigned int unpackFrame(msgpack::object const& frame, msgpack::object const*& payload);

    protected:
        /// Called with an object that was read and holds descriptions of volume proxies.
        virtual void rebuildProxies(Object& geometry);
        /// Reads a pointer of type `code`: inline, and from version 2 on perhaps null or a reference.
        [[nodiscard]] virtual Nexil::Any unpackPointer(unsigned int code, msgpack::object const& payload);
        [[nodiscard]] virtual Nexil::Any unpackTrivialArray(ValueRow const& row, msgpack::object const& payload);
        /// The list of elements of an array that is no trivial one.
        [[nodiscard]] virtual msgpack::object const& elementList(msgpack::object const& payload);
        /// True for a node that stands for a null pointer or an empty value.
        [[nodiscard]] virtual bool isNull(msgpack::object const& node) const;
        /// Whether the chunks of this stream are compressed.
        [[nodiscard]] virtual bool isCompressed() const;

        [[nodiscard]] ItemReader& item() const noexcept { return item_; }

    private:
        [[nodiscard]] Nexil::Any unpackPointee(unsigned int code, msgpack::object const& payload);
        [[nodiscard]] Nexil::Any unpackNested(unsigned int code, msgpack::object const& payload);

        ItemReader& item_;
    };

} // namespace V1

namespace V2 {

    /// Values of version 2: nil for null pointers and empty values.
    class UnpackVisitor : public V1::UnpackVisitor {
    public:
        using V1::UnpackVisitor::UnpackVisitor;
        [[nodiscard]] Nexil::Ptr<Object> unpackObjectPointer(msgpack::object const& node) override;

    protected:
        [[nodiscard]] Nexil::Any unpackPointer(unsigned int code, msgpack::object const& payload) override;
        [[nodiscard]] bool isNull(msgpack::object const& node) const override;
    };

} // namespace V2

namespace V3 {

    /// What an unsigned integer in the place of a pointer means.
    class References {
    public:
        /// The shared value with this number, of exactly the type of `code`.
        [[nodiscard]] virtual Nexil::Any resolve(std::uint64_t number, unsigned int code) = 0;

    protected:
        ~References() = default;
    };

    /// Values of versions 3 and later: arrays are [kind, payload]; references where the stream has them.
    class UnpackVisitor : public V2::UnpackVisitor {
    public:
        /// references: null for a stream without them; outlives the visitor.
        /// proxies: rebuilds those of volumes; null for a stream that has none; outlives the visitor.
        UnpackVisitor(ItemReader& item, bool hasCompressedChunks, References* references,
                      Geometry::Internal::ProxyRebuilder* proxies)
            : V2::UnpackVisitor(item), references_(references), proxies_(proxies),
              hasCompressedChunks_(hasCompressedChunks)
        {
        }

        [[nodiscard]] Nexil::Ptr<Object> unpackObjectPointer(msgpack::object const& node) override;

    protected:
        void rebuildProxies(Object& geometry) override;
        [[nodiscard]] Nexil::Any unpackPointer(unsigned int code, msgpack::object const& payload) override;
        [[nodiscard]] Nexil::Any unpackTrivialArray(ValueRow const& row, msgpack::object const& payload) override;
        [[nodiscard]] msgpack::object const& elementList(msgpack::object const& payload) override;
        [[nodiscard]] bool isCompressed() const override;

    private:
        References* references_;
        Geometry::Internal::ProxyRebuilder* proxies_;
        bool hasCompressedChunks_;
    };

} // namespace V3

} // namespace Veldrin::IO
