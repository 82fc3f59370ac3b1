#pragma once

#include <nexil/Export.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <new>
#include <type_traits>
#include <utility>

/// Shared pointers with copy-on-write.
///
/// `Ptr<T>` gives read-only access and is shared freely; `MutablePtr<T>` gives write access and is alone while it
/// exists. A change of a shared value takes three steps, and copies only when somebody else still looks:
///
///     Nexil::Ptr<Mesh> shared = ...;
///     Nexil::MutablePtr<Mesh> own(std::move(shared)); // copies only if another Ptr holds the mesh
///     own->count = 5;
///     shared = std::move(own);                        // never copies
///
/// Threads: copies of one pointer value may be made and dropped on many threads at once. One `Ptr` variable is, like an
/// int, not to be written by two threads without a lock.
/// Destruction: what a value holds the last `Ptr` to is destroyed right after the value itself, not within its
/// destructor, so that long chains need no stack. Its destructor must not use anything that its holder owned.
namespace Nexil {

template <class T>
class Ptr;
template <class T>
class MutablePtr;

namespace Internal {

    /// Shared bookkeeping of one managed value: its reference count and how to copy and to destroy it.
    class VELDRIN_PLATFORM_API ControlBlock {
    public:
        ControlBlock(ControlBlock const&) = delete;
        ControlBlock& operator=(ControlBlock const&) = delete;

        void acquire() noexcept { count_.fetch_add(1, std::memory_order_relaxed); }

        /// Gives one reference up; the last one destroys the value, without recursion into what the value holds.
        void drop() noexcept
        {
            if (count_.fetch_sub(1, std::memory_order_acq_rel) == 1)
                releaseWithoutRecursion(this);
        }

        /// True when the caller holds the only reference; what other holders did before dropping theirs is visible.
        [[nodiscard]] bool isUnique() const noexcept { return count_.load(std::memory_order_acquire) == 1; }

        [[nodiscard]] std::uint64_t useCount() const noexcept { return count_.load(std::memory_order_relaxed); }

        /// Makes a new block, count 1, that holds a copy of the value at the same offset within the block.
        [[nodiscard]] virtual ControlBlock* clone() const = 0;
        /// Destroys the value and the block.
        virtual void release() noexcept = 0;

    protected:
        ControlBlock() noexcept = default;
        // Blocks go through release() alone, so the virtual table holds just clone and release.
        ~ControlBlock() = default;

    private:
        friend struct PendingReleases;
        static void releaseWithoutRecursion(ControlBlock* block) noexcept;

        std::atomic<std::uint64_t> count_{1};
    };

    /// A block with its value inside: one allocation for both.
    template <class T>
    class InPlaceBlock final : public ControlBlock {
    public:
        template <class... Arguments>
        explicit InPlaceBlock(Arguments&&... arguments) : value(std::forward<Arguments>(arguments)...)
        {
        }

        [[nodiscard]] ControlBlock* clone() const override { return new InPlaceBlock(value); }
        void release() noexcept override { delete this; }

        T value;
    };

    struct PtrAccess;

} // namespace Internal

/// Shared, read-only pointer: an object address and its control block; both null when empty.
template <class T>
class Ptr {
public:
    using element_type = T;

    constexpr Ptr() noexcept = default;
    constexpr Ptr(std::nullptr_t) noexcept {}

    Ptr(Ptr const& other) noexcept : object_(other.object_), block_(other.block_)
    {
        if (block_)
            block_->acquire();
    }

    Ptr(Ptr&& other) noexcept
        : object_(std::exchange(other.object_, nullptr)), block_(std::exchange(other.block_, nullptr))
    {
    }

    /// A pointer to a base of what `other` points to; a later clone still copies the whole derived object.
    template <class Derived>
        requires(!std::is_same_v<Derived, T> && std::is_convertible_v<Derived const*, T const*>)
    Ptr(Ptr<Derived> const& other) noexcept : object_(other.object_), block_(other.block_)
    {
        if (block_)
            block_->acquire();
    }

    template <class Derived>
        requires(!std::is_same_v<Derived, T> && std::is_convertible_v<Derived const*, T const*>)
    Ptr(Ptr<Derived>&& other) noexcept
        : object_(std::exchange(other.object_, nullptr)), block_(std::exchange(other.block_, nullptr))
    {
    }

    /// Ends the writable phase: the value is shared from here on. Never copies.
    template <class Derived>
        requires std::is_convertible_v<Derived const*, T const*>
    Ptr(MutablePtr<Derived>&& other) noexcept
        : object_(std::exchange(other.object_, nullptr)), block_(std::exchange(other.block_, nullptr))
    {
    }

    Ptr& operator=(Ptr other) noexcept
    {
        swap(other);
        return *this;
    }

    ~Ptr()
    {
        if (block_)
            block_->drop();
    }

    void swap(Ptr& other) noexcept
    {
        std::swap(object_, other.object_);
        std::swap(block_, other.block_);
    }

    void reset() noexcept { Ptr().swap(*this); }

    [[nodiscard]] T const* get() const noexcept { return object_; }
    [[nodiscard]] T const& operator*() const noexcept { return *object_; }
    [[nodiscard]] T const* operator->() const noexcept { return object_; }
    [[nodiscard]] explicit operator bool() const noexcept { return object_ != nullptr; }

    /// Number of pointers to the value now; 0 when null. Another thread may change it at any time.
    [[nodiscard]] std::uint64_t useCount() const noexcept { return block_ ? block_->useCount() : 0; }

    /// Equality is identity: the same address, not equal content.
    friend bool operator==(Ptr const& a, Ptr const& b) noexcept { return a.object_ == b.object_; }
    friend bool operator==(Ptr const& a, std::nullptr_t) noexcept { return a.object_ == nullptr; }

private:
    template <class>
    friend class Ptr;
    template <class>
    friend class MutablePtr;
    friend struct Internal::PtrAccess;

    T const* object_ = nullptr;
    Internal::ControlBlock* block_ = nullptr;
};

/// Writable pointer without sharing; moves, does not copy.
template <class T>
class MutablePtr {
public:
    using element_type = T;

    constexpr MutablePtr() noexcept = default;
    constexpr MutablePtr(std::nullptr_t) noexcept {}

    MutablePtr(MutablePtr&& other) noexcept
        : object_(std::exchange(other.object_, nullptr)), block_(std::exchange(other.block_, nullptr))
    {
    }

    /// A writable pointer to a base of what `other` points to; a later clone still copies the whole derived object.
    template <class Derived>
        requires(!std::is_same_v<Derived, T> && std::is_convertible_v<Derived*, T*>)
    MutablePtr(MutablePtr<Derived>&& other) noexcept
        : object_(std::exchange(other.object_, nullptr)), block_(std::exchange(other.block_, nullptr))
    {
    }

    /// Copy-on-write: takes over the value, address kept, when `shared` held the only reference; otherwise owns a
    /// private copy (of the dynamic type) and gives the reference of `shared` up. Null yields null.
    ///
    /// Errors: what the value's copy constructor throws; `shared` is unchanged then.
    explicit MutablePtr(Ptr<T>&& shared)
    {
        if (!shared.block_)
            return;
        if (shared.block_->isUnique()) {
            // The value was created non-const by makePtr or makeMutable, so the cast restores what it is.
            object_ = const_cast<T*>(std::exchange(shared.object_, nullptr));
            block_ = std::exchange(shared.block_, nullptr);
            return;
        }
        block_ = shared.block_->clone();
        // Both blocks are of one type, so the copy lies where the original lies within its block.
        auto const offset =
            reinterpret_cast<char const*>(shared.object_) - reinterpret_cast<char const*>(shared.block_);
        object_ = reinterpret_cast<T*>(reinterpret_cast<char*>(block_) + offset);
        shared.reset();
    }

    MutablePtr& operator=(MutablePtr other) noexcept
    {
        swap(other);
        return *this;
    }

    ~MutablePtr()
    {
        if (block_)
            block_->drop();
    }

    void swap(MutablePtr& other) noexcept
    {
        std::swap(object_, other.object_);
        std::swap(block_, other.block_);
    }

    void reset() noexcept { MutablePtr().swap(*this); }

    [[nodiscard]] T* get() const noexcept { return object_; }
    [[nodiscard]] T& operator*() const noexcept { return *object_; }
    [[nodiscard]] T* operator->() const noexcept { return object_; }
    [[nodiscard]] explicit operator bool() const noexcept { return object_ != nullptr; }

private:
    template <class>
    friend class Ptr;
    template <class>
    friend class MutablePtr;
    friend struct Internal::PtrAccess;

    T* object_ = nullptr;
    Internal::ControlBlock* block_ = nullptr;
};

namespace Internal {

    /// Lets the factories below put a fresh block into a pointer.
    struct PtrAccess {
        template <class T>
        static MutablePtr<T> adopt(InPlaceBlock<T>* block) noexcept
        {
            MutablePtr<T> pointer;
            pointer.object_ = &block->value;
            pointer.block_ = block;
            return pointer;
        }

        template <class Derived, class Base>
        static Ptr<Derived> dynamicCast(Ptr<Base>&& pointer) noexcept
        {
            Ptr<Derived> cast;
            if (auto const* const derived = dynamic_cast<Derived const*>(pointer.object_)) {
                cast.object_ = derived;
                cast.block_ = std::exchange(pointer.block_, nullptr);
                pointer.object_ = nullptr;
            }
            return cast;
        }
    };

} // namespace Internal

/// A new value of type T, made from `arguments`, for one writer. T must be copyable, so that copy-on-write can copy it.
template <class T, class... Arguments>
[[nodiscard]] MutablePtr<T> makeMutable(Arguments&&... arguments)
{
    static_assert(std::is_copy_constructible_v<T>, "managed values are copied on write");
    return Internal::PtrAccess::adopt(new Internal::InPlaceBlock<T>(std::forward<Arguments>(arguments)...));
}

/// A new shared value of type T, made from `arguments`.
template <class T, class... Arguments>
[[nodiscard]] Ptr<T> makePtr(Arguments&&... arguments)
{
    return Ptr<T>(makeMutable<T>(std::forward<Arguments>(arguments)...));
}

/// The same value as a `Derived`, which may also be a base or a sibling of `Base`; null when it is none.
template <class Derived, class Base>
[[nodiscard]] Ptr<Derived> dynamicPtrCast(Ptr<Base> pointer) noexcept
{
    return Internal::PtrAccess::dynamicCast<Derived>(std::move(pointer));
}

} // namespace Nexil
