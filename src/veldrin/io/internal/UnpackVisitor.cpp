#include <veldrin/io/internal/UnpackVisitor.h>

#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/io/internal/CurveTree.h>
#include <veldrin/math/FCurve.h>

#include <limits>
#include <type_traits>
#include <vector>

namespace Veldrin::IO {

namespace {

    using Geometry::Common::DataInterpolationMode;
    using Geometry::Common::GeoLocation;
    using ObjectPtr = Nexil::Ptr<Object>;
    using CurvePtr = Nexil::Ptr<Math::FCurve>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    template <class Integer>
    Integer unpackInteger(msgpack::object const& node)
    {
        using Limits = std::numeric_limits<Integer>;
        if (node.type == msgpack::type::POSITIVE_INTEGER) {
            if (node.via.u64 > static_cast<std::uint64_t>(Limits::max()))
                throw Nexil::String("Integral type overflow");
            return static_cast<Integer>(node.via.u64);
        }
        if (node.type != msgpack::type::NEGATIVE_INTEGER)
            throwMalformed();
        if (node.via.i64 < static_cast<std::int64_t>(Limits::min()))
            throw Nexil::String("Integral type overflow");
        return static_cast<Integer>(node.via.i64);
    }

    float unpackFloat(msgpack::object const& node)
    {
        if (node.type != msgpack::type::FLOAT32)
            throwMalformed();
        return static_cast<float>(node.via.f64);
    }

    double unpackDouble(msgpack::object const& node)
    {
        if (node.type != msgpack::type::FLOAT64)
            throwMalformed();
        return node.via.f64;
    }

    Nexil::String unpackString(msgpack::object const& node)
    {
        if (node.type != msgpack::type::STR)
            throwMalformed();
        return {node.via.str.ptr, node.via.str.size};
    }

    DataInterpolationMode unpackInterpolation(msgpack::object const& node)
    {
        auto const value = unpackInteger<unsigned int>(node);
        if (value > static_cast<unsigned int>(DataInterpolationMode::DefaultValue))
            throw Nexil::String("Integral type overflow");
        return static_cast<DataInterpolationMode>(value);
    }

    Nexil::Any unpackScalar(unsigned int code, msgpack::object const& node)
    {
        switch (code) {
        case 0: return unpackInteger<unsigned char>(node);
        case 1: return unpackInteger<unsigned short>(node);
        case 2: return unpackInteger<unsigned int>(node);
        case 3: return unpackInteger<unsigned long long>(node);
        case 4: return unpackInteger<signed char>(node);
        case 5: return unpackInteger<short>(node);
        case 6: return unpackInteger<int>(node);
        case 7: return unpackInteger<long long>(node);
        case 8: return unpackFloat(node);
        case 9: return unpackDouble(node);
        default: return node.as<bool>();
        }
    }

    /// Reads each element of a list into a new array.
    template <class T, class Unpack>
    ArrayPtr<T> unpackElements(msgpack::object const& list, Unpack const& unpack)
    {
        auto array = Nexil::makeMutable<Nexil::Array<T>>();
        array->reserve(list.via.array.size);
        for (auto const& element : list.via.array)
            array->push_back(unpack(element));
        return array;
    }

} // namespace

namespace V1 {

    unsigned int UnpackVisitor::unpackFrame(msgpack::object const& frame, msgpack::object const*& payload)
    {
        if (frame.type != msgpack::type::ARRAY || frame.via.array.size != 2 ||
            frame.via.array.ptr[0].type != msgpack::type::POSITIVE_INTEGER)
            throwMalformed();
        payload = frame.via.array.ptr + 1;
        std::uint64_t const code = frame.via.array.ptr[0].via.u64;
        return code < TypeCode::kCount ? static_cast<unsigned int>(code) : TypeCode::kUnknown;
    }

    void UnpackVisitor::unpackObject(msgpack::object const& node, Object& object)
    {
        if (node.type != msgpack::type::ARRAY || node.via.array.size % 2 != 0)
            throwMalformed();
        bool hasDescriptions = false;
        auto const* const end = node.via.array.ptr + node.via.array.size;
        for (auto const* pair = node.via.array.ptr; pair != end; pair += 2) {
            Nexil::String const name = unpackString(pair[0]);
            Nexil::Any value;
            if (!isNull(pair[1])) {
                msgpack::object const* payload = nullptr;
                unsigned int const code = unpackFrame(pair[1], payload);
                if (code == TypeCode::kUnknown)
                    throw Nexil::String("Unknown property: ") + name;
                value = unpackPayload(code, *payload);
            }
            if (auto const* const held = value.get<ObjectPtr>(); held && *held)
                hasDescriptions = hasDescriptions || Geometry::Internal::isProxyDescription(**held);
            // Refuses an empty name: such a property is dropped.
            object.setPropertyAny(name, std::move(value));
        }
        if (hasDescriptions)
            rebuildProxies(object);
    }

    void UnpackVisitor::rebuildProxies(Object&) {}

    Nexil::Ptr<Object> UnpackVisitor::unpackObjectPointer(msgpack::object const& node)
    {
        auto object = createObject();
        unpackObject(node, *object);
        return object;
    }

    Nexil::Any UnpackVisitor::unpackPayload(unsigned int code, msgpack::object const& payload)
    {
        if (TypeCode::isScalar(code))
            return unpackScalar(code, payload);
        if (code == TypeCode::kString)
            return unpackString(payload);
        if (TypeCode::isMathValue(code))
            return readMathValue(item_, payload, valueRow(code), isCompressed());
        if (TypeCode::isShareable(code))
            return unpackPointer(code, payload);
        if (code == TypeCode::kInterpolation)
            return unpackInterpolation(payload);
        if (code == TypeCode::kCurve)
            return isNull(payload) ? CurvePtr() : unpackCurve(payload);
        // A geo location: what is left.
        if (payload.type != msgpack::type::ARRAY || payload.via.array.size != 12)
            throw Nexil::String("Invalid geo location array. Data is corrupt.");
        auto const* field = payload.via.array.ptr;
        GeoLocation location;
        for (auto& id : location.ids)
            id = unpackInteger<unsigned int>(*field++);
        for (auto& parameter : location.params)
            parameter = unpackFloat(*field++);
        location.indices = *unpackPointer(TypeCode::kUnsignedIntArray, *field++).get<ArrayPtr<unsigned int>>();
        location.weights = *unpackPointer(TypeCode::kFloatArray, *field).get<ArrayPtr<float>>();
        return location;
    }

    Nexil::Any UnpackVisitor::unpackPointer(unsigned int code, msgpack::object const& payload)
    {
        return unpackPointee(code, payload);
    }

    Nexil::Any UnpackVisitor::unpackPointee(unsigned int code, msgpack::object const& payload)
    {
        if (code == TypeCode::kObject)
            return unpackObjectPointer(payload);
        if (TypeCode::isTrivialArray(code))
            return unpackTrivialArray(valueRow(code - TypeCode::kArray), payload);
        if (TypeCode::isNestedValueArray(code))
            return unpackNested(code, payload);

        auto const& list = elementList(payload);
        auto elementOf = [this](unsigned int elementCode) {
            return [this, elementCode](msgpack::object const& node) { return unpackPayload(elementCode, node); };
        };
        switch (code) {
        case TypeCode::kArray + TypeCode::kString: return unpackElements<Nexil::String>(list, unpackString);
        case TypeCode::kInterpolationArray: return unpackElements<DataInterpolationMode>(list, unpackInterpolation);
        case TypeCode::kObjectArray:
            return unpackElements<ObjectPtr>(list, [this](msgpack::object const& node) {
                return *unpackPointer(TypeCode::kObject, node).get<ObjectPtr>();
            });
        case TypeCode::kNestedObjectArray:
            return unpackElements<ArrayPtr<ObjectPtr>>(list, [this](msgpack::object const& node) {
                return *unpackPointer(TypeCode::kObjectArray, node).get<ArrayPtr<ObjectPtr>>();
            });
        case TypeCode::kCurveArray:
            return unpackElements<CurvePtr>(list, [element = elementOf(TypeCode::kCurve)](msgpack::object const& node) {
                return *element(node).get<CurvePtr>();
            });
        case TypeCode::kGeoLocationArray:
            return unpackElements<GeoLocation>(
                list, [element = elementOf(TypeCode::kGeoLocation)](msgpack::object const& node) {
                    return *element(node).get<GeoLocation>();
                });
        default: // values of any type
            return unpackElements<Nexil::Any>(list, [this](msgpack::object const& node) -> Nexil::Any {
                if (isNull(node))
                    return {};
                msgpack::object const* inner = nullptr;
                unsigned int const elementCode = unpackFrame(node, inner);
                if (elementCode == TypeCode::kUnknown)
                    throw Nexil::String("any type not supported");
                return unpackPayload(elementCode, *inner);
            });
        }
    }

    Nexil::Any UnpackVisitor::unpackNested(unsigned int code, msgpack::object const& payload)
    {
        auto const& list = elementList(payload);
        unsigned int const elementCode = TypeCode::elementOfNested(code);
        std::vector<Nexil::Any> arrays;
        arrays.reserve(list.via.array.size);
        for (auto const& element : list.via.array)
            arrays.push_back(unpackPointer(elementCode, element));
        return valueRow(code - TypeCode::kNestedArray).nestArrays(arrays.data(), arrays.size());
    }

    Nexil::Any UnpackVisitor::unpackTrivialArray(ValueRow const& row, msgpack::object const& payload)
    {
        return readTrivialArray(item_, payload, row, isCompressed(), ChunkFraming::Plain);
    }

    msgpack::object const& UnpackVisitor::elementList(msgpack::object const& payload)
    {
        if (payload.type != msgpack::type::ARRAY)
            throw Nexil::String("Corrupted array");
        return payload;
    }

    bool UnpackVisitor::isNull(msgpack::object const&) const
    {
        return false;
    }

    bool UnpackVisitor::isCompressed() const
    {
        return true;
    }

} // namespace V1

namespace V2 {

    Nexil::Ptr<Object> UnpackVisitor::unpackObjectPointer(msgpack::object const& node)
    {
        return isNull(node) ? ObjectPtr() : V1::UnpackVisitor::unpackObjectPointer(node);
    }

    Nexil::Any UnpackVisitor::unpackPointer(unsigned int code, msgpack::object const& payload)
    {
        return isNull(payload) ? nullPointer(code) : V1::UnpackVisitor::unpackPointer(code, payload);
    }

    bool UnpackVisitor::isNull(msgpack::object const& node) const
    {
        return node.type == msgpack::type::NIL;
    }

} // namespace V2

namespace V3 {

    void UnpackVisitor::rebuildProxies(Object& geometry)
    {
        if (proxies_)
            proxies_->rebuild(geometry);
    }

    namespace {

        /// The payload of [kind, payload], where `kind` is the one that is due.
        msgpack::object const& payloadOfKind(msgpack::object const& array, std::uint64_t kind, char const* otherwise)
        {
            if (array.type != msgpack::type::ARRAY || array.via.array.size != 2 ||
                array.via.array.ptr[0].type != msgpack::type::POSITIVE_INTEGER || array.via.array.ptr[0].via.u64 > 1)
                throwMalformed();
            if (array.via.array.ptr[0].via.u64 != kind)
                throw Nexil::String(otherwise);
            return array.via.array.ptr[1];
        }

        constexpr std::uint64_t kBlob = 0;
        constexpr std::uint64_t kElementList = 1;

    } // namespace

    Nexil::Ptr<Object> UnpackVisitor::unpackObjectPointer(msgpack::object const& node)
    {
        if (references_ && node.type == msgpack::type::POSITIVE_INTEGER)
            return *references_->resolve(node.via.u64, TypeCode::kObject).get<ObjectPtr>();
        return V2::UnpackVisitor::unpackObjectPointer(node);
    }

    Nexil::Any UnpackVisitor::unpackPointer(unsigned int code, msgpack::object const& payload)
    {
        if (references_ && payload.type == msgpack::type::POSITIVE_INTEGER)
            return references_->resolve(payload.via.u64, code);
        if (payload.type != msgpack::type::ARRAY && !isNull(payload))
            throwMalformed();
        return V2::UnpackVisitor::unpackPointer(code, payload);
    }

    Nexil::Any UnpackVisitor::unpackTrivialArray(ValueRow const& row, msgpack::object const& payload)
    {
        auto const& list = payloadOfKind(payload, kBlob, "Deserializing trivial type as non-trivial type");
        return readTrivialArray(item(), list, row, isCompressed(), ChunkFraming::Framed);
    }

    msgpack::object const& UnpackVisitor::elementList(msgpack::object const& payload)
    {
        return V1::UnpackVisitor::elementList(
            payloadOfKind(payload, kElementList, "Deserializing non-trivial type as binary blob"));
    }

    bool UnpackVisitor::isCompressed() const
    {
        return hasCompressedChunks_;
    }

} // namespace V3

} // namespace Veldrin::IO
