#include <nexil/SerializationData.h>

#include <algorithm>

namespace Nexil {

// The tree's classes hold each other, so their special members are made here, where all of them are complete.

CompositeSerializationData::CompositeSerializationData() = default;
CompositeSerializationData::CompositeSerializationData(CompositeSerializationData const&) = default;
CompositeSerializationData::CompositeSerializationData(CompositeSerializationData&&) noexcept = default;
CompositeSerializationData& CompositeSerializationData::operator=(CompositeSerializationData const&) = default;
CompositeSerializationData& CompositeSerializationData::operator=(CompositeSerializationData&&) noexcept = default;
CompositeSerializationData::~CompositeSerializationData() = default;

bool CompositeSerializationData::get(String const& name, SerializationData& child) const
{
    auto const* found = find(name);
    if (!found)
        return false;
    // Copied before anything is given up: `child` may be the node that this composite is part of.
    SerializationData copy(*found);
    child = std::move(copy);
    return true;
}

SerializationData const* CompositeSerializationData::find(String const& name) const
{
    auto const place = indexOfName_.find(name);
    return place == indexOfName_.end() ? nullptr : &children_[place->second].second;
}

SerializationData& CompositeSerializationData::operator[](String const& name)
{
    if (auto const place = indexOfName_.find(name); place != indexOfName_.end())
        return children_[place->second].second;
    children_.emplace_back(name, SerializationData());
    try {
        indexOfName_.emplace(name, children_.size() - 1);
    } catch (...) {
        children_.pop_back();
        throw;
    }
    return children_.back().second;
}

std::size_t CompositeSerializationData::size() const noexcept
{
    return children_.size();
}

String const& CompositeSerializationData::nameAt(std::size_t index) const noexcept
{
    return children_[index].first;
}

SerializationData const& CompositeSerializationData::childAt(std::size_t index) const noexcept
{
    return children_[index].second;
}

bool operator==(CompositeSerializationData const& a, CompositeSerializationData const& b)
{
    return a.children_ == b.children_;
}

SequenceSerializationData::SequenceSerializationData() = default;
SequenceSerializationData::SequenceSerializationData(SequenceSerializationData const&) = default;
SequenceSerializationData::SequenceSerializationData(SequenceSerializationData&&) noexcept = default;
SequenceSerializationData& SequenceSerializationData::operator=(SequenceSerializationData const&) = default;
SequenceSerializationData& SequenceSerializationData::operator=(SequenceSerializationData&&) noexcept = default;
SequenceSerializationData::~SequenceSerializationData() = default;

void SequenceSerializationData::push_back(SerializationData child)
{
    children_.push_back(std::move(child));
}

std::size_t SequenceSerializationData::size() const noexcept
{
    return children_.size();
}

SerializationData const* SequenceSerializationData::begin() const noexcept
{
    return children_.data();
}

SerializationData const* SequenceSerializationData::end() const noexcept
{
    return children_.data() + children_.size();
}

bool operator==(SequenceSerializationData const& a, SequenceSerializationData const& b)
{
    return a.children_ == b.children_;
}

} // namespace Nexil
