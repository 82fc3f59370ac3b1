#pragma once

#include <veldrin/object/Object.h>

#include <gtest/gtest.h>

namespace support {

/// An object whose arrays would have to be built to be read, which no test of it may ask for. It tells their types and sizes.
struct Costly : Veldrin::Object {
    [[nodiscard]] Nexil::Any getProperty(Nexil::String const& key) const override
    {
        EXPECT_FALSE(key == "data" || key == "indices") << "built " << key << ", which nobody asked for";
        return Object::getProperty(key);
    }
    [[nodiscard]] Veldrin::PropertyInfo propertyInfo(Nexil::String const& key) const override
    {
        return Object(*this).propertyInfo(key);
    }
};

} // namespace support
