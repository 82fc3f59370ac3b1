#pragma once

#include <nexil/Export.h>
#include <nexil/String.h>

#include <cstddef>
#include <map>
#include <utility>
#include <variant>
#include <vector>

/// A small tree of named and listed numbers: the neutral form in which a value describes itself for storage.
///
///     Nexil::CompositeSerializationData curve;
///     curve["keys"] = Nexil::SequenceSerializationData();
namespace Nexil {

class SerializationData;

/// A leaf: an unsigned integer, a double, or nothing.
class LiteralSerializationData {
public:
    LiteralSerializationData() noexcept = default;
    LiteralSerializationData(unsigned int value) noexcept : value_(value) {}
    LiteralSerializationData(double value) noexcept : value_(value) {}

    [[nodiscard]] bool isNothing() const noexcept { return std::holds_alternative<std::monostate>(value_); }
    [[nodiscard]] bool isInt() const noexcept { return std::holds_alternative<unsigned int>(value_); }
    [[nodiscard]] bool isDouble() const noexcept { return std::holds_alternative<double>(value_); }

    /// The integer; 0 for anything else.
    [[nodiscard]] unsigned int asInt() const noexcept
    {
        auto const* value = std::get_if<unsigned int>(&value_);
        return value ? *value : 0;
    }
    /// The number, an integer converted; 0 for nothing.
    [[nodiscard]] double asDouble() const noexcept
    {
        auto const* value = std::get_if<double>(&value_);
        return value ? *value : static_cast<double>(asInt());
    }

    friend bool operator==(LiteralSerializationData const&, LiteralSerializationData const&) = default;

private:
    std::variant<std::monostate, unsigned int, double> value_;
};

/// Children by name, kept in the order in which they were first named.
class VELDRIN_PLATFORM_API CompositeSerializationData {
public:
    CompositeSerializationData();
    CompositeSerializationData(CompositeSerializationData const&);
    CompositeSerializationData(CompositeSerializationData&&) noexcept;
    CompositeSerializationData& operator=(CompositeSerializationData const&);
    CompositeSerializationData& operator=(CompositeSerializationData&&) noexcept;
    ~CompositeSerializationData();

    /// Copies the child `name` into `child`; false, and `child` untouched, when there is none. `child` may be the node
    /// that holds this composite, which walks down one level and ends this composite.
    bool get(String const& name, SerializationData& child) const;
    /// The child `name`; null when there is none.
    [[nodiscard]] SerializationData const* find(String const& name) const;
    /// The child `name`, made as nothing when there is none. The reference lasts until the next new name.
    SerializationData& operator[](String const& name);

    [[nodiscard]] std::size_t size() const noexcept;
    [[nodiscard]] String const& nameAt(std::size_t index) const noexcept;
    [[nodiscard]] SerializationData const& childAt(std::size_t index) const noexcept;

    friend VELDRIN_PLATFORM_API bool operator==(CompositeSerializationData const& a,
                                                CompositeSerializationData const& b);

private:
    std::vector<std::pair<String, SerializationData>> children_;
    std::map<String, std::size_t> indexOfName_;
};

/// Children in a row.
class VELDRIN_PLATFORM_API SequenceSerializationData {
public:
    SequenceSerializationData();
    SequenceSerializationData(SequenceSerializationData const&);
    SequenceSerializationData(SequenceSerializationData&&) noexcept;
    SequenceSerializationData& operator=(SequenceSerializationData const&);
    SequenceSerializationData& operator=(SequenceSerializationData&&) noexcept;
    ~SequenceSerializationData();

    void push_back(SerializationData child);
    [[nodiscard]] std::size_t size() const noexcept;
    [[nodiscard]] SerializationData const* begin() const noexcept;
    [[nodiscard]] SerializationData const* end() const noexcept;

    friend VELDRIN_PLATFORM_API bool operator==(SequenceSerializationData const& a, SequenceSerializationData const& b);

private:
    std::vector<SerializationData> children_;
};

/// Any node of the tree; nothing by default. Copies are deep.
class SerializationData {
public:
    SerializationData() = default;
    SerializationData(LiteralSerializationData literal) : node_(literal) {}
    SerializationData(CompositeSerializationData composite) : node_(std::move(composite)) {}
    SerializationData(SequenceSerializationData sequence) : node_(std::move(sequence)) {}
    SerializationData(unsigned int value) : node_(LiteralSerializationData(value)) {}
    SerializationData(double value) : node_(LiteralSerializationData(value)) {}

    /// The node as what it is; null when it is something else.
    [[nodiscard]] CompositeSerializationData const* asComposite() const noexcept
    {
        return std::get_if<CompositeSerializationData>(&node_);
    }
    [[nodiscard]] SequenceSerializationData const* asSequence() const noexcept
    {
        return std::get_if<SequenceSerializationData>(&node_);
    }
    [[nodiscard]] LiteralSerializationData const* asLiteral() const noexcept
    {
        return std::get_if<LiteralSerializationData>(&node_);
    }

    friend bool operator==(SerializationData const&, SerializationData const&) = default;

private:
    std::variant<LiteralSerializationData, CompositeSerializationData, SequenceSerializationData> node_;
};

} // namespace Nexil
