#pragma once

#include <nexil/Array.h>
#include <nexil/Export.h>
#include <nexil/Ptr.h>
#include <nexil/String.h>
#include <nexil/TypeId.h>

#include <cstddef>
#include <cstdint>
#include <new>
#include <type_traits>
#include <utility>

/// The type-erased value that properties are made of.
///
///     Nexil::Any value = 3u;
///     value.get<unsigned int>(); // points to 3
///     value.get<int>();          // null: types match exactly, nothing converts
namespace Nexil {

class Any;

namespace Internal {

    template <class T>
    struct ArrayPointer : std::false_type {};
    template <class E>
    struct ArrayPointer<Ptr<Array<E>>> : std::true_type {};

    /// How an Any handles the type it holds.
    struct AnyOperations {
        std::type_info const& type;
        void (*copy)(void const* from, void* to);
        void (*move)(void* from, void* to) noexcept;
        void (*destroy)(void* storage) noexcept;
        /// Size of the array pointed to (0 when null); null for what is no pointer to an array.
        std::uint64_t (*arraySize)(void const* value) noexcept;
        bool isInline;
    };

    template <class T>
    constexpr bool fitsAnyInline = sizeof(T) <= 32 && alignof(T) <= 8 && std::is_nothrow_move_constructible_v<T>;

    template <class T>
    struct AnyInline {
        static T* value(void* storage) noexcept { return std::launder(static_cast<T*>(storage)); }
        static T const* value(void const* storage) noexcept { return std::launder(static_cast<T const*>(storage)); }
        static void copy(void const* from, void* to) { ::new (to) T(*value(from)); }
        static void move(void* from, void* to) noexcept
        {
            ::new (to) T(std::move(*value(from)));
            value(from)->~T();
        }
        static void destroy(void* storage) noexcept { value(storage)->~T(); }
    };

    template <class T>
    struct AnyHeap {
        static T* value(void* storage) noexcept { return *static_cast<T**>(storage); }
        static T const* value(void const* storage) noexcept { return *static_cast<T* const*>(storage); }
        static void copy(void const* from, void* to) { ::new (to) T*(new T(*value(from))); }
        static void move(void* from, void* to) noexcept { ::new (to) T*(*static_cast<T**>(from)); }
        static void destroy(void* storage) noexcept { delete value(storage); }
    };

    template <class T>
    using AnyStorage = std::conditional_t<fitsAnyInline<T>, AnyInline<T>, AnyHeap<T>>;

    template <class T>
    std::uint64_t anyArraySize(void const* storage) noexcept
    {
        auto const* array = AnyStorage<T>::value(storage)->get();
        return array ? array->size() : 0;
    }

    template <class T>
    constexpr auto anyArraySizeOperation() noexcept -> std::uint64_t (*)(void const*) noexcept
    {
        if constexpr (ArrayPointer<T>::value)
            return &anyArraySize<T>;
        else
            return nullptr;
    }

    template <class T>
    inline constexpr AnyOperations anyOperations{typeid(T),
                                                 &AnyStorage<T>::copy,
                                                 &AnyStorage<T>::move,
                                                 &AnyStorage<T>::destroy,
                                                 anyArraySizeOperation<T>(),
                                                 fitsAnyInline<T>};

} // namespace Internal

/// One value of any copyable type, or nothing.
///
/// Every `Ptr`, `String` and other value of up to 32 bytes, with an alignment of up to 8 and a move that does not throw,
/// is held without the heap; others on it.
/// Copying copies the value (a `Ptr` shares what it points to); moving never throws and leaves the source empty.
/// Errors: std::bad_alloc and what the value's copy constructor throws; the target is unchanged then.
class Any {
public:
    Any() noexcept = default;

    template <class T, class Value = std::decay_t<T>>
        requires(!std::is_same_v<Value, Any> && std::is_copy_constructible_v<Value>)
    Any(T&& value) : operations_(&Internal::anyOperations<Value>)
    {
        if constexpr (Internal::fitsAnyInline<Value>)
            ::new (static_cast<void*>(storage_)) Value(std::forward<T>(value));
        else
            ::new (static_cast<void*>(storage_)) Value*(new Value(std::forward<T>(value)));
    }

    Any(Any const& other)
    {
        if (other.operations_)
            other.operations_->copy(other.storage_, storage_);
        operations_ = other.operations_;
    }

    Any(Any&& other) noexcept : operations_(std::exchange(other.operations_, nullptr))
    {
        if (operations_)
            operations_->move(other.storage_, storage_);
    }

    Any& operator=(Any const& other)
    {
        Any copy(other);
        return *this = std::move(copy);
    }

    Any& operator=(Any&& other) noexcept
    {
        if (this != &other) {
            // The old value goes last: `other` may be a part of it.
            Any const old(std::move(*this));
            operations_ = std::exchange(other.operations_, nullptr);
            if (operations_)
                operations_->move(other.storage_, storage_);
        }
        return *this;
    }

    ~Any() { reset(); }

    void reset() noexcept
    {
        if (auto const* operations = std::exchange(operations_, nullptr))
            operations->destroy(storage_);
    }

    [[nodiscard]] bool empty() const noexcept { return operations_ == nullptr; }

    /// The exact type held; no type when empty.
    [[nodiscard]] TypeId type() const noexcept { return operations_ ? TypeId(operations_->type) : TypeId(); }

    /// The value when it is exactly a T, else null. There is no conversion between types.
    template <class T>
    [[nodiscard]] T const* get() const noexcept
    {
        return holds<T>() ? Internal::AnyStorage<T>::value(static_cast<void const*>(storage_)) : nullptr;
    }
    template <class T>
    [[nodiscard]] T* get() noexcept
    {
        return holds<T>() ? Internal::AnyStorage<T>::value(static_cast<void*>(storage_)) : nullptr;
    }

    /// True when the value is exactly a T.
    template <class T>
    [[nodiscard]] bool holds() const noexcept
    {
        // What cannot be copied is never held, but may be asked for.
        if constexpr (std::is_copy_constructible_v<T>)
            return operations_ == &Internal::anyOperations<T> || (operations_ && operations_->type == typeid(T));
        else
            return false;
    }

private:
    friend struct AnyArray;

    alignas(8) std::byte storage_[32];
    Internal::AnyOperations const* operations_ = nullptr;
};

/// Questions about pointers to arrays of whatever element type.
struct AnyArray {
    /// True when the value is a `Ptr<Array<T>>` of any T, null ones included.
    [[nodiscard]] static bool is_any_array(Any const& value) noexcept
    {
        return value.operations_ && value.operations_->arraySize;
    }
    /// Number of elements of that array; 0 for a null pointer and for what is no pointer to an array.
    [[nodiscard]] static std::uint64_t get_any_array_size(Any const& value) noexcept
    {
        return is_any_array(value) ? value.operations_->arraySize(value.storage_) : 0;
    }
};

/// The C++ spelling of the held type, for people; "" for an empty Any.
[[nodiscard]] inline String anyToTypeString(Any const& value)
{
    return Internal::DebugTypeId::getTypeNameForDebugOnly(value.type());
}

} // namespace Nexil
