#include "ValueRows.h"

#include <nexil/Array.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <veldrin/geometry/DataInterpolationMode.h>
#include <veldrin/geometry/GeoLocation.h>
#include <veldrin/geometry/Names.h>
#include <veldrin/math/BBox.h>
#include <veldrin/math/FCurve.h>
#include <veldrin/math/Matrix.h>
#include <veldrin/math/Quaternion.h>
#include <veldrin/math/Vector.h>
#include <veldrin/object/Object.h>
#include <veldrin/volume/VldProxyComponentContainer.h>

#include <fmt/format.h>

#include <unordered_map>
#include <unordered_set>

namespace Zon {

namespace {

    using namespace Veldrin;
    using Geometry::Common::DataInterpolationMode;
    using Geometry::Common::GeoLocation;

    template <class T>
    using ArrayPtr = Nexil::Ptr<Nexil::Array<T>>;
    using ObjectPtr = Nexil::Ptr<Object>;

    template <class T>
    ValueView viewOfArray(ArrayPtr<T> const& array)
    {
        return array ? ValueView{array->data(), array->size(), false, array.get()}
                     : ValueView{nullptr, 0, true, nullptr};
    }

    template <class T>
    ValueView viewValue(Nexil::Any const& value)
    {
        return {value.get<T>(), 1, false, nullptr};
    }

    template <class T>
    ValueView viewArray(Nexil::Any const& value)
    {
        return viewOfArray(*value.get<ArrayPtr<T>>());
    }

    template <class T>
    ValueView viewInner(Nexil::Any const& value, std::uint64_t index)
    {
        return viewOfArray((**value.get<ArrayPtr<ArrayPtr<T>>>())[index]);
    }

    /// The rows, and the three types of each by identity.
    struct Tables {
        std::vector<ValueRow> rows;
        std::unordered_map<Nexil::TypeId, KnownType> types;

        Tables()
        {
            rows.reserve(kRowCount); // rows are pointed to
            addScalars();
            add<Nexil::String>("string", ScalarKind::Text, 1);
            addVectors<2>();
            addVectors<3>();
            addVectors<4>();
            addMatrices<2, 2>();
            addMatrices<2, 3>();
            addMatrices<2, 4>();
            addMatrices<3, 2>();
            addMatrices<3, 3>();
            addMatrices<3, 4>();
            addMatrices<4, 2>();
            addMatrices<4, 3>();
            addMatrices<4, 4>();
            add<Math::quatf>("Math::quatf", ScalarKind::Float32, 4);
            add<Math::quatd>("Math::quatd", ScalarKind::Float64, 4);
            add<Math::bbox<Math::float3, float>>("Math::bbox<Math::float3, float>", ScalarKind::Float32, 6);
        }

    private:
        static constexpr std::size_t kRowCount = 120;

        template <class T>
        void add(std::string name, ScalarKind kind, unsigned int componentCount)
        {
            rows.push_back({std::move(name), kind, componentCount, sizeof(T)});
            ValueRow const* const row = &rows.back();
            using Shape = KnownType::Shape;
            types.emplace(Nexil::TypeId::of<T>(), KnownType{row, Shape::Value, &viewValue<T>, nullptr});
            types.emplace(Nexil::TypeId::of<ArrayPtr<T>>(), KnownType{row, Shape::Array, &viewArray<T>, nullptr});
            types.emplace(Nexil::TypeId::of<ArrayPtr<ArrayPtr<T>>>(),
                          KnownType{row, Shape::ArrayOfArrays, &viewArray<ArrayPtr<T>>, &viewInner<T>});
        }

        void addScalars()
        {
            add<unsigned char>("unsigned char", ScalarKind::UInt8, 1);
            add<unsigned short>("unsigned short", ScalarKind::UInt16, 1);
            add<unsigned int>("unsigned int", ScalarKind::UInt32, 1);
            add<unsigned long long>("unsigned long long", ScalarKind::UInt64, 1);
            add<signed char>("signed char", ScalarKind::Int8, 1);
            add<short>("short", ScalarKind::Int16, 1);
            add<int>("int", ScalarKind::Int32, 1);
            add<long long>("long long", ScalarKind::Int64, 1);
            add<float>("float", ScalarKind::Float32, 1);
            add<double>("double", ScalarKind::Float64, 1);
            add<bool>("bool", ScalarKind::Bool, 1);
        }

        template <int N>
        void addVectors()
        {
            auto const name = [](char const* scalar) { return fmt::format("Math::{}{}", scalar, N); };
            add<Math::Vector<unsigned char, N>>(name("uchar"), ScalarKind::UInt8, N);
            add<Math::Vector<unsigned short, N>>(name("ushort"), ScalarKind::UInt16, N);
            add<Math::Vector<unsigned int, N>>(name("uint"), ScalarKind::UInt32, N);
            add<Math::Vector<unsigned long long, N>>(name("ulong"), ScalarKind::UInt64, N);
            add<Math::Vector<signed char, N>>(name("char"), ScalarKind::Int8, N);
            add<Math::Vector<short, N>>(name("short"), ScalarKind::Int16, N);
            add<Math::Vector<int, N>>(name("int"), ScalarKind::Int32, N);
            add<Math::Vector<long long, N>>(name("long"), ScalarKind::Int64, N);
            add<Math::Vector<float, N>>(name("float"), ScalarKind::Float32, N);
            add<Math::Vector<double, N>>(name("double"), ScalarKind::Float64, N);
            add<Math::Vector<bool, N>>(name("bool"), ScalarKind::Bool, N);
        }

        template <int R, int C>
        void addMatrices()
        {
            auto const name = [](char const* scalar) { return fmt::format("Math::{}{}x{}", scalar, R, C); };
            add<Math::Matrix<unsigned short, R, C>>(name("ushort"), ScalarKind::UInt16, R * C);
            add<Math::Matrix<unsigned int, R, C>>(name("uint"), ScalarKind::UInt32, R * C);
            add<Math::Matrix<unsigned long long, R, C>>(name("ulong"), ScalarKind::UInt64, R * C);
            add<Math::Matrix<short, R, C>>(name("short"), ScalarKind::Int16, R * C);
            add<Math::Matrix<int, R, C>>(name("int"), ScalarKind::Int32, R * C);
            add<Math::Matrix<long long, R, C>>(name("long"), ScalarKind::Int64, R * C);
            add<Math::Matrix<float, R, C>>(name("float"), ScalarKind::Float32, R * C);
            add<Math::Matrix<double, R, C>>(name("double"), ScalarKind::Float64, R * C);
        }
    };

    Tables const& tables()
    {
        static Tables const built;
        return built;
    }

    /// Types of files that are no values of a row, from number 360 on.
    constexpr std::uint64_t kFirstOtherCode = 360;
    constexpr char const* kOtherNames[] = {"interpolation mode",
                                           "array<interpolation mode>",
                                           "object",
                                           "array<object>",
                                           "array<array<object>>",
                                           "curve",
                                           "array<curve>",
                                           "geo location",
                                           "array<geo location>",
                                           "array<any>"};

    template <class... Types>
    struct TypeList {};

    template <class... Types>
    int indexOfType(TypeList<Types...>, Nexil::Any const& value)
    {
        int index = 0;
        bool const found = ((value.holds<Types>() || (++index, false)) || ...);
        return found ? index : -1;
    }

    using OtherTypes =
        TypeList<DataInterpolationMode, ArrayPtr<DataInterpolationMode>, ObjectPtr, ArrayPtr<ObjectPtr>,
                 ArrayPtr<ArrayPtr<ObjectPtr>>, Nexil::Ptr<Math::FCurve>, ArrayPtr<Nexil::Ptr<Math::FCurve>>,
                 GeoLocation, ArrayPtr<GeoLocation>, ArrayPtr<Nexil::Any>>;

    std::uint64_t bytesOfView(ValueView const& view, ValueRow const& row)
    {
        if (row.kind != ScalarKind::Text)
            return view.size * row.byteCount;
        std::uint64_t bytes = 0;
        for (std::uint64_t i = 0; i < view.size; ++i)
            bytes += static_cast<Nexil::String const*>(view.data)[i].size();
        return bytes;
    }

    /// Adds up bytes without recursion: objects may hold each other to any depth.
    class ByteSum {
    public:
        std::uint64_t of(Nexil::Any const& value)
        {
            pending_.push_back(value);
            while (!pending_.empty()) {
                auto const next = std::move(pending_.back());
                pending_.pop_back();
                add(next);
            }
            return sum_;
        }

    private:
        bool isNew(void const* address) { return address && seen_.insert(address).second; }

        void add(Nexil::Any const& value)
        {
            if (auto const* const known = knownType(value)) {
                auto const view = known->view(value);
                if (known->shape != KnownType::Shape::Value && !isNew(view.identity))
                    return;
                if (known->shape != KnownType::Shape::ArrayOfArrays) {
                    sum_ += bytesOfView(view, *known->row);
                    return;
                }
                for (std::uint64_t i = 0; i < view.size; ++i)
                    if (auto const inner = known->inner(value, i); isNew(inner.identity))
                        sum_ += bytesOfView(inner, *known->row);
            } else if (auto const* const object = value.get<ObjectPtr>()) {
                if (isNew(object->get()))
                    addObject(**object);
            } else if (auto const* const curve = value.get<Nexil::Ptr<Math::FCurve>>()) {
                if (isNew(curve->get()))
                    sum_ += (*curve)->keys().size() * sizeof(Math::FCurve::Key);
            } else if (auto const* const location = value.get<GeoLocation>()) {
                sum_ += sizeof location->ids + sizeof location->params;
                pending_.emplace_back(location->indices);
                pending_.emplace_back(location->weights);
            } else if (value.holds<DataInterpolationMode>()) {
                sum_ += sizeof(DataInterpolationMode);
            } else if (auto const* const modes = value.get<ArrayPtr<DataInterpolationMode>>()) {
                if (isNew(modes->get()))
                    sum_ += (*modes)->size() * sizeof(DataInterpolationMode);
            } else {
                addElements<ObjectPtr>(value);
                addElements<ArrayPtr<ObjectPtr>>(value);
                addElements<Nexil::Ptr<Math::FCurve>>(value);
                addElements<GeoLocation>(value);
                addElements<Nexil::Any>(value);
            }
        }

        void addObject(Object const& object)
        {
            // Indices of a volume count up, and are only made when they are read.
            bool const hasMadeIndices = dynamic_cast<Geometry::VldProxyComponentContainer const*>(&object);
            for (auto const& key : object.keys())
                if (hasMadeIndices && key == Geometry::sIndices)
                    sum_ += object.propertyInfo(key).arraySize * sizeof(unsigned int);
                else
                    pending_.push_back(object.getProperty(key));
        }

        template <class T>
        void addElements(Nexil::Any const& value)
        {
            auto const* const array = value.get<ArrayPtr<T>>();
            if (array && isNew(array->get()))
                for (T const& element : **array)
                    pending_.emplace_back(element);
        }

        std::vector<Nexil::Any> pending_;
        std::unordered_set<void const*> seen_;
        std::uint64_t sum_ = 0;
    };

} // namespace

std::vector<ValueRow> const& valueRows()
{
    return tables().rows;
}

KnownType const* knownType(Nexil::Any const& value)
{
    auto const found = tables().types.find(value.type());
    return found == tables().types.end() ? nullptr : &found->second;
}

std::string typeName(Nexil::Any const& value)
{
    if (value.empty())
        return "nothing";
    if (auto const* const known = knownType(value)) {
        auto const& name = known->row->name;
        return known->shape == KnownType::Shape::Value   ? name
               : known->shape == KnownType::Shape::Array ? fmt::format("array<{}>", name)
                                                         : fmt::format("array<array<{}>>", name);
    }
    int const other = indexOfType(OtherTypes(), value);
    return other >= 0 ? kOtherNames[other] : std::string(Nexil::anyToTypeString(value).view());
}

std::string typeNameOfCode(std::uint64_t code)
{
    auto const& rows = tables().rows;
    if (code < rows.size())
        return rows[code].name;
    if (code < 2 * rows.size())
        return fmt::format("array<{}>", rows[code - rows.size()].name);
    if (code < 3 * rows.size())
        return fmt::format("array<array<{}>>", rows[code - 2 * rows.size()].name);
    return code - kFirstOtherCode < std::size(kOtherNames) ? kOtherNames[code - kFirstOtherCode] : "";
}

std::uint64_t decodedBytes(Nexil::Any const& value)
{
    return ByteSum().of(value);
}

} // namespace Zon
