#include <veldrin/io/internal/PackVisitor.h>

#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/io/internal/CurveTree.h>
#include <veldrin/math/FCurve.h>

#include <cstring>
#include <limits>
#include <utility>
#include <vector>

namespace Veldrin::IO::V3 {

namespace {

    using Geometry::Common::DataInterpolationMode;
    using Geometry::Common::GeoLocation;
    using ObjectPtr = Nexil::Ptr<Object>;
    using CurvePtr = Nexil::Ptr<Math::FCurve>;
    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    constexpr std::uint64_t kMaxItems = std::numeric_limits<std::uint32_t>::max();

    template <class T>
    T loadAs(std::byte const* bytes)
    {
        T value;
        std::memcpy(&value, bytes, sizeof(value));
        return value;
    }

    std::uint32_t checkedCount(std::uint64_t count)
    {
        if (count > kMaxItems)
            throw Nexil::String("overflow");
        return static_cast<std::uint32_t>(count);
    }

} // namespace

PackVisitor::PackVisitor(ByteSink& sink, int compressionLevel, ObjectGraph const* graph,
                         Nexil::RuntimeServices const* services)
    : sink_(sink), packer_(sink), compressionLevel_(compressionLevel), graph_(graph), services_(services)
{
}

void PackVisitor::packEntry(Nexil::Any const& pointer)
{
    StreamType const& type = streamTypeOf(pointer);
    if (type.code == TypeCode::kUnknown)
        throw Nexil::String("Attempt to serialize unknown value type");
    packer_.pack_array(2);
    packer_.pack_unsigned_int(type.code);
    packPointee(pointer, type);
}

void PackVisitor::packObject(Object const& object)
{
    struct Property {
        Nexil::String const& name;
        Nexil::Any value;
        StreamType const* type; // null for an empty value
    };
    Nexil::Array<Nexil::String> const keys = object.keys();
    std::vector<Property> properties;
    properties.reserve(keys.size());
    for (Nexil::String const& key : keys) {
        Nexil::Any value = object.getProperty(key);
        StreamType const* const type = value.empty() ? nullptr : &streamTypeOf(value);
        if (type && type->code == TypeCode::kUnknown)
            warnOfUnknown(key, value);
        else
            properties.push_back({key, std::move(value), type});
    }
    if (properties.size() > kMaxItems / 2)
        throw Nexil::String("Object has too many properties");
    packer_.pack_array(static_cast<std::uint32_t>(properties.size() * 2));
    for (Property const& property : properties) {
        packString(property.name);
        if (property.type)
            packFrame(property.value, *property.type);
        else
            packer_.pack_nil();
    }
}

void PackVisitor::packFrame(Nexil::Any const& value, StreamType const& type)
{
    packer_.pack_array(2);
    packer_.pack_unsigned_int(type.code);
    packPayload(value, type);
}

void PackVisitor::packPayload(Nexil::Any const& value, StreamType const& type)
{
    if (type.address)
        return packPointer(value, type);
    if (TypeCode::isScalar(type.code))
        return packScalar(type.code, type.valueBytes(value));
    if (type.code == TypeCode::kString)
        return packString(*value.get<Nexil::String>());
    if (TypeCode::isMathValue(type.code))
        return writeChunks(packer_, sink_, type.valueBytes(value), 1, type.elementSize, compressionLevel_);
    if (type.code == TypeCode::kInterpolation) {
        auto const mode = *value.get<DataInterpolationMode>();
        // A file with any other number could not be read again.
        if (mode > DataInterpolationMode::DefaultValue)
            throw Nexil::String("Integral type overflow");
        packer_.pack_unsigned_int(static_cast<unsigned int>(mode));
        return;
    }
    if (type.code == TypeCode::kCurve) {
        auto const& curve = *value.get<CurvePtr>();
        Nexil::SerializationData tree;
        if (curve)
            Nexil::serializeFCurve(*curve, tree);
        return packTree(packer_, tree);
    }
    // A geo location: what is left.
    auto const& location = *value.get<GeoLocation>();
    packer_.pack_array(12);
    for (auto const id : location.ids)
        packer_.pack_unsigned_int(id);
    for (auto const parameter : location.params)
        packer_.packFloat(parameter);
    packElement(location.indices);
    packElement(location.weights);
}

void PackVisitor::packPointer(Nexil::Any const& pointer, StreamType const& type)
{
    std::uint64_t useCount = 0;
    std::uint64_t entry = 0;
    void const* const address = type.address(pointer, useCount);
    if (address && graph_ && graph_->findEntry(address, entry))
        packer_.pack_uint64(entry);
    else
        packPointee(pointer, type);
}

void PackVisitor::packPointee(Nexil::Any const& pointer, StreamType const& type)
{
    std::uint64_t useCount = 0;
    if (!type.address(pointer, useCount)) {
        packer_.pack_nil();
        return;
    }
    if (type.code == TypeCode::kObject) {
        Object const& object = **pointer.get<ObjectPtr>();
        return packObject(graph_ ? graph_->contentOf(object) : object);
    }

    constexpr unsigned char kBlob = 0;
    constexpr unsigned char kElementList = 1;
    packer_.pack_array(2);
    if (TypeCode::isTrivialArray(type.code)) {
        packer_.pack_unsigned_char(kBlob);
        ArrayBytes const array = type.arrayBytes(pointer);
        return writeChunks(packer_, sink_, array.bytes, array.count, type.elementSize, compressionLevel_);
    }
    packer_.pack_unsigned_char(kElementList);
    auto packOne = [this](auto const& element) { packElement(element); };
    if (type.nestedCount) {
        std::uint64_t const count = type.nestedCount(pointer);
        packer_.pack_array(checkedCount(count));
        for (std::uint64_t i = 0; i < count; ++i)
            packElement(type.nestedElement(pointer, i));
        return;
    }
    switch (type.code) {
    case TypeCode::kArray + TypeCode::kString:
        return packElements(**pointer.get<ArrayPtr<Nexil::String>>(),
                            [this](Nexil::String const& text) { packString(text); });
    case TypeCode::kInterpolationArray: return packElements(**pointer.get<ArrayPtr<DataInterpolationMode>>(), packOne);
    case TypeCode::kObjectArray: return packElements(**pointer.get<ArrayPtr<ObjectPtr>>(), packOne);
    case TypeCode::kCurveArray: return packElements(**pointer.get<ArrayPtr<CurvePtr>>(), packOne);
    case TypeCode::kGeoLocationArray: return packElements(**pointer.get<ArrayPtr<GeoLocation>>(), packOne);
    default: // values of any type
        return packElements(**pointer.get<ArrayPtr<Nexil::Any>>(), [this](Nexil::Any const& value) {
            StreamType const& valueType = streamTypeOf(value);
            if (value.empty())
                packer_.pack_nil();
            else if (valueType.code == TypeCode::kUnknown)
                throw Nexil::String("Unserializable type found in an Any!");
            else
                packFrame(value, valueType);
        });
    }
}

void PackVisitor::packElement(Nexil::Any const& element)
{
    packPayload(element, streamTypeOf(element));
}

template <class Elements, class PackOne>
void PackVisitor::packElements(Elements const& elements, PackOne const& packOne)
{
    packer_.pack_array(checkedCount(elements.size()));
    for (auto const& element : elements)
        packOne(element);
}

void PackVisitor::packScalar(unsigned int code, std::byte const* bytes)
{
    switch (code) {
    case 0: packer_.pack_unsigned_char(loadAs<unsigned char>(bytes)); break;
    case 1: packer_.pack_unsigned_short(loadAs<unsigned short>(bytes)); break;
    case 2: packer_.pack_unsigned_int(loadAs<unsigned int>(bytes)); break;
    case 3: packer_.pack_unsigned_long_long(loadAs<unsigned long long>(bytes)); break;
    case 4: packer_.pack_signed_char(loadAs<signed char>(bytes)); break;
    case 5: packer_.pack_short(loadAs<short>(bytes)); break;
    case 6: packer_.pack_int(loadAs<int>(bytes)); break;
    case 7: packer_.pack_long_long(loadAs<long long>(bytes)); break;
    case 8: packer_.packFloat(loadAs<float>(bytes)); break;
    case 9: packer_.packDouble(loadAs<double>(bytes)); break;
    default: loadAs<unsigned char>(bytes) != 0 ? packer_.pack_true() : packer_.pack_false(); break;
    }
}

void PackVisitor::packString(Nexil::String const& text)
{
    std::uint32_t const size = checkedCount(text.size());
    packer_.pack_str(size);
    packer_.pack_str_body(text.c_str(), size);
}

void PackVisitor::warnOfUnknown(Nexil::String const& name, Nexil::Any const& value) const
{
    if (!services_)
        return;
    Nexil::String text = "Property '";
    text += name;
    text += "' is of the unknown type: '";
    text += Nexil::Internal::DebugTypeId::getTypeNameForDebugOnly(value.type());
    text += "'. it will not be serialized.";
    services_->logMessage({Nexil::RuntimeMessageCategory::Warning, text});
}

} // namespace Veldrin::IO::V3
