#include <veldrin/io/internal/StreamTypes.h>

#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/internal/ValueTypes.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/object/Object.h>

#include <array>
#include <type_traits>
#include <unordered_map>

namespace Veldrin::IO {

namespace {

    using Geometry::Common::DataInterpolationMode;
    using Geometry::Common::GeoLocation;
    using Geometry::Internal::kValueTypeCount;

    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;

    template <class T>
    constexpr bool isPlainBytes = std::is_trivially_copyable_v<T>;

    // Functions of a type. Each is called only for values that hold exactly that type.

    template <class T>
    Nexil::Any fromBytes(std::byte const* bytes)
    {
        return *reinterpret_cast<T const*>(bytes);
    }

    template <class T>
    std::byte const* valueBytes(Nexil::Any const& value)
    {
        return reinterpret_cast<std::byte const*>(value.get<T>());
    }

    template <class T>
    NewArray newArray(std::uint64_t count)
    {
        auto array = Nexil::makeMutable<Nexil::Array<T>>();
        Nexil::Internal::resizeUninitialized(*array, count);
        auto* const bytes = reinterpret_cast<std::byte*>(array->data());
        return {ArrayPtr<T>(std::move(array)), bytes};
    }

    template <class T>
    ArrayBytes arrayBytes(Nexil::Any const& pointer)
    {
        auto const& array = **pointer.get<ArrayPtr<T>>();
        return {reinterpret_cast<std::byte const*>(array.data()), array.size()};
    }

    template <class Pointer>
    void const* address(Nexil::Any const& value, std::uint64_t& useCount)
    {
        auto const& pointer = *value.get<Pointer>();
        useCount = pointer.useCount();
        // The most derived object's address: one object seen through two bases is one object.
        if constexpr (std::is_polymorphic_v<typename Pointer::element_type>)
            return dynamic_cast<void const*>(pointer.get());
        else
            return pointer.get();
    }

    template <class Element>
    std::uint64_t nestedCount(Nexil::Any const& pointer)
    {
        return (*pointer.get<ArrayPtr<Element>>())->size();
    }

    template <class Element>
    Nexil::Any nestedElement(Nexil::Any const& pointer, std::uint64_t index)
    {
        return (**pointer.get<ArrayPtr<Element>>())[index];
    }

    template <class Pointer>
    Nexil::Any makeNullPointer()
    {
        return Pointer();
    }

    template <class Element>
    Nexil::Any nestArrays(Nexil::Any const* arrays, std::uint64_t count)
    {
        auto nested = Nexil::makeMutable<Nexil::Array<Element>>();
        nested->reserve(count);
        for (std::uint64_t i = 0; i < count; ++i)
            nested->push_back(*arrays[i].get<Element>());
        return ArrayPtr<Element>(std::move(nested));
    }

    template <class T>
    constexpr bool holdsBools()
    {
        if constexpr (requires { typename T::value_type; })
            return std::is_same_v<typename T::value_type, bool>;
        else
            return std::is_same_v<T, bool>;
    }

    struct Tables {
        std::array<ValueRow, kValueTypeCount> rows;
        std::array<Nexil::TypeId, TypeCode::kCount> types;
        std::array<Nexil::Any (*)(), TypeCode::kCount> makeNull{};
        std::unordered_map<Nexil::TypeId, StreamType> byType;

        Tables()
        {
            Geometry::Internal::forEachValueType([this]<class T>(unsigned int code, char const* name) {
                addRow<T>(code, name);
                addWritten<T>(code);
                types[code] = Nexil::TypeId::of<T>();
                addPointer<ArrayPtr<T>>(TypeCode::kArray + code);
                addPointer<ArrayPtr<ArrayPtr<T>>>(TypeCode::kNestedArray + code);
            });
            Geometry::Internal::forEachValueTypeTwin([this]<class T>(unsigned int code) { addWritten<T>(code); });

            addPlain<DataInterpolationMode>(TypeCode::kInterpolation);
            addShareable<ArrayPtr<DataInterpolationMode>>(TypeCode::kInterpolationArray);
            addShareable<Nexil::Ptr<Object>>(TypeCode::kObject);
            addShareable<ArrayPtr<Nexil::Ptr<Object>>>(TypeCode::kObjectArray);
            addNested<ArrayPtr<Nexil::Ptr<Object>>>(TypeCode::kNestedObjectArray);
            addPointer<Nexil::Ptr<Math::FCurve>>(TypeCode::kCurve);
            byType[types[TypeCode::kCurve]] = StreamType{TypeCode::kCurve, sizeof(Nexil::Ptr<Math::FCurve>)};
            addShareable<ArrayPtr<Nexil::Ptr<Math::FCurve>>>(TypeCode::kCurveArray);
            addPlain<GeoLocation>(TypeCode::kGeoLocation);
            addShareable<ArrayPtr<GeoLocation>>(TypeCode::kGeoLocationArray);
            addShareable<ArrayPtr<Nexil::Any>>(TypeCode::kAnyArray);
        }

    private:
        template <class T>
        void addRow(unsigned int code, char const* name)
        {
            ValueRow& row = rows[code];
            row.name = name;
            row.elementSize = sizeof(T);
            row.holdsBools = holdsBools<T>();
            row.nestArrays = &nestArrays<ArrayPtr<T>>;
            if constexpr (isPlainBytes<T>) {
                row.fromBytes = &fromBytes<T>;
                row.newArray = &newArray<T>;
            }
        }

        /// A value type, its arrays and its nested arrays, as the packer sees them.
        template <class T>
        void addWritten(unsigned int code)
        {
            StreamType value{code, sizeof(T)};
            StreamType array{TypeCode::kArray + code, sizeof(T)};
            array.address = &address<ArrayPtr<T>>;
            if constexpr (isPlainBytes<T>) {
                value.valueBytes = &valueBytes<T>;
                array.arrayBytes = &arrayBytes<T>;
            }
            byType[Nexil::TypeId::of<T>()] = value;
            byType[Nexil::TypeId::of<ArrayPtr<T>>()] = array;
            byType[Nexil::TypeId::of<ArrayPtr<ArrayPtr<T>>>()] = nestedType<ArrayPtr<T>>(TypeCode::kNestedArray + code);
        }

        template <class T>
        void addPlain(unsigned int code)
        {
            types[code] = Nexil::TypeId::of<T>();
            byType[types[code]] = StreamType{code, sizeof(T)};
        }

        template <class Pointer>
        void addPointer(unsigned int code)
        {
            types[code] = Nexil::TypeId::of<Pointer>();
            makeNull[code] = &makeNullPointer<Pointer>;
        }

        template <class Pointer>
        void addShareable(unsigned int code)
        {
            addPointer<Pointer>(code);
            byType[types[code]] = StreamType{code, sizeof(Pointer)};
            byType[types[code]].address = &address<Pointer>;
        }

        template <class Element>
        void addNested(unsigned int code)
        {
            addPointer<ArrayPtr<Element>>(code);
            byType[types[code]] = nestedType<Element>(code);
        }

        template <class Element>
        static StreamType nestedType(unsigned int code)
        {
            StreamType nested{code, sizeof(Element)};
            nested.address = &address<ArrayPtr<Element>>;
            nested.nestedCount = &nestedCount<Element>;
            nested.nestedElement = &nestedElement<Element>;
            return nested;
        }
    };

    Tables const& tables()
    {
        static Tables const instance;
        return instance;
    }

} // namespace

ValueRow const& valueRow(unsigned int code)
{
    return tables().rows[code];
}

StreamType const& streamTypeOf(Nexil::Any const& value)
{
    static StreamType const unknown;
    auto const& byType = tables().byType;
    auto const found = byType.find(value.type());
    return found == byType.end() ? unknown : found->second;
}

Nexil::TypeId typeOfCode(unsigned int code)
{
    return tables().types[code];
}

Nexil::Any nullPointer(unsigned int code)
{
    return tables().makeNull[code]();
}

} // namespace Veldrin::IO
