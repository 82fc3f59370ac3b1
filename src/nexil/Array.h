#pragma once

#include <nexil/Export.h>
#include <nexil/TypeId.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <memory>
#include <type_traits>
#include <utility>

/// The contiguous array that holds all geometry data.
///
///     Nexil::Array<Math::float3> positions{{0, 0, 0}, {1, 0, 0}, {0, 1, 0}};
///     auto shared = Nexil::makePtr<Nexil::Array<Math::float3>>(std::move(positions)); // no element is copied
///
/// Copying an Array copies its elements; arrays in objects are held by `Ptr` and are shared instead.
namespace Nexil {

namespace Internal {

    /// What an array's storage needs to know of its element type: size and alignment in bytes, and which type it is.
    struct VELDRIN_PLATFORM_API UntypedTypeRep {
        std::uint32_t size = 0;
        std::uint32_t alignment = 0;
        std::type_info const* type = nullptr;

        template <class T>
        [[nodiscard]] static UntypedTypeRep of() noexcept
        {
            return {sizeof(T), alignof(T), &typeid(T)};
        }

        /// Uninitialised storage for `count` elements, null for 0. Large blocks ask the system for huge pages.
        /// Errors: std::bad_alloc, also when the byte size does not fit 64 bits.
        [[nodiscard]] void* allocate(std::uint64_t count) const;
        /// The same for a block that a doubling array will soon leave again: on ordinary pages.
        [[nodiscard]] void* allocateWhileGrowing(std::uint64_t count) const;
        void deallocate(void* pointer, std::uint64_t count) const noexcept;
    };

    struct ArrayAccess;

    /// Blocks of so many bytes and more ask the system for huge pages. Below, an array gains nothing from them, and the
    /// padding to whole ones would be a large share.
    inline constexpr std::size_t kHugePagesFromBytes = std::size_t(16) << 20;

    /// Has the system give all pages of a block, or of a part of one, at once, for callers that are about to overwrite it:
    /// page by page, as bytes arrive, fresh memory takes 1.6 times as long to fill from a file. Where the pages are there
    /// already, or the block is too small to matter, this costs one question at most.
    VELDRIN_PLATFORM_API void takePages(void* block, std::size_t byteCount) noexcept;

} // namespace Internal

/// A growable array of T: data pointer, 64-bit size, 64-bit capacity and element type.
///
/// `Array<bool>` is an array of bytes like any other.
/// Growth: an append to a full array moves to a capacity of 1, 2, 4, 8, ...; `resize` and `reserve` take exactly what
/// they are asked for. Nothing but destruction, assignment and moving gives storage back.
/// Errors: std::bad_alloc where storage is needed; the array is unchanged then.
template <class T>
class Array {
public:
    using value_type = T;
    using iterator = T*;
    using const_iterator = T const*;

    Array() noexcept = default;

    Array(std::initializer_list<T> values) : Array(values.begin(), values.size()) {}

    /// A copy of the `count` elements that start at `first`.
    Array(T const* first, std::uint64_t count)
    {
        Storage fresh(type_, count);
        std::uninitialized_copy_n(first, count, fresh.data);
        fresh.swapInto(*this, count);
    }

    Array(Array const& other) : Array(other.data_, other.size_) {}

    Array(Array&& other) noexcept
        : data_(std::exchange(other.data_, nullptr)), size_(std::exchange(other.size_, 0)),
          capacity_(std::exchange(other.capacity_, 0))
    {
    }

    Array& operator=(Array other) noexcept
    {
        swap(other);
        return *this;
    }

    ~Array()
    {
        std::destroy_n(data_, size_);
        type_.deallocate(data_, capacity_);
    }

    void swap(Array& other) noexcept
    {
        std::swap(data_, other.data_);
        std::swap(size_, other.size_);
        std::swap(capacity_, other.capacity_);
    }

    [[nodiscard]] std::uint64_t size() const noexcept { return size_; }
    [[nodiscard]] std::uint64_t capacity() const noexcept { return capacity_; }
    [[nodiscard]] bool empty() const noexcept { return size_ == 0; }

    [[nodiscard]] T* data() noexcept { return data_; }
    [[nodiscard]] T const* data() const noexcept { return data_; }
    [[nodiscard]] T& operator[](std::uint64_t index) noexcept { return data_[index]; }
    [[nodiscard]] T const& operator[](std::uint64_t index) const noexcept { return data_[index]; }
    [[nodiscard]] T* begin() noexcept { return data_; }
    [[nodiscard]] T const* begin() const noexcept { return data_; }
    [[nodiscard]] T* end() noexcept { return data_ + size_; }
    [[nodiscard]] T const* end() const noexcept { return data_ + size_; }

    [[nodiscard]] Internal::UntypedTypeRep const& elementType() const noexcept { return type_; }

    /// Appends `value`, which may be an element of this array.
    void push_back(T const& value) { append(value); }
    void push_back(T&& value) { append(std::move(value)); }

    /// Capacity for at least `count` elements; exactly that many when it must grow.
    void reserve(std::uint64_t count)
    {
        if (count > capacity_)
            relocate(count);
    }

    /// Changes the size; new elements are value-initialised (numbers are 0). A growing array takes exactly `count`
    /// elements of storage, a shrinking one keeps what it has.
    void resize(std::uint64_t count)
    {
        reserve(count);
        if (count > size_)
            std::uninitialized_value_construct_n(data_ + size_, count - size_);
        else
            std::destroy_n(data_ + count, size_ - count);
        size_ = count;
    }

    /// Drops all elements and keeps the storage.
    void clear() noexcept
    {
        std::destroy_n(data_, size_);
        size_ = 0;
    }

    /// Same size and equal elements.
    friend bool operator==(Array const& a, Array const& b)
    {
        return std::equal(a.begin(), a.end(), b.begin(), b.end());
    }

private:
    friend struct Internal::ArrayAccess;

    /// Fresh storage that is given back unless it ends up in an array.
    struct Storage {
        Storage(Internal::UntypedTypeRep const& elementType, std::uint64_t count, bool isGrowing = false)
            : type(elementType),
              data(static_cast<T*>(isGrowing ? elementType.allocateWhileGrowing(count) : elementType.allocate(count))),
              capacity(count)
        {
        }
        Storage(Storage const&) = delete;
        Storage& operator=(Storage const&) = delete;
        ~Storage() { type.deallocate(data, capacity); }

        void swapInto(Array& array, std::uint64_t size) noexcept
        {
            std::swap(array.data_, data);
            std::swap(array.capacity_, capacity);
            array.size_ = size;
        }

        Internal::UntypedTypeRep const& type;
        T* data;
        std::uint64_t capacity;
    };

    template <class Source>
    void append(Source&& value)
    {
        if (size_ == capacity_) {
            Storage fresh(type_, capacity_ + std::max<std::uint64_t>(capacity_, 1), true);
            // Before the others move, so that a failure changes nothing and `value` may be one of them.
            std::construct_at(fresh.data + size_, std::forward<Source>(value));
            moveInto(fresh);
        } else {
            std::construct_at(data_ + size_, std::forward<Source>(value));
        }
        ++size_;
    }

    void relocate(std::uint64_t capacity)
    {
        Storage fresh(type_, capacity);
        moveInto(fresh);
    }

    void moveInto(Storage& fresh) noexcept
    {
        if constexpr (std::is_trivially_copyable_v<T>) {
            if (size_ != 0)
                std::memcpy(static_cast<void*>(fresh.data), data_, size_ * sizeof(T));
        } else {
            static_assert(std::is_nothrow_move_constructible_v<T>, "a failed append must leave the array unchanged");
            std::uninitialized_move_n(data_, size_, fresh.data);
            std::destroy_n(data_, size_);
        }
        fresh.swapInto(*this, size_);
    }

    T* data_ = nullptr;
    std::uint64_t size_ = 0;
    std::uint64_t capacity_ = 0;
    Internal::UntypedTypeRep type_ = Internal::UntypedTypeRep::of<T>();
};

namespace Internal {

    struct ArrayAccess {
        template <class T>
        static void resizeUninitialized(Array<T>& array, std::uint64_t count)
        {
            array.reserve(count);
            array.size_ = count;
        }
    };

    /// Resizes without filling the new elements, for callers that overwrite each of them: filling fresh memory first
    /// costs more than many a computation that follows.
    template <class T>
    void resizeUninitialized(Array<T>& array, std::uint64_t count)
    {
        static_assert(std::is_trivially_copyable_v<T> && std::is_trivially_destructible_v<T>);
        ArrayAccess::resizeUninitialized(array, count);
    }

} // namespace Internal

} // namespace Nexil
