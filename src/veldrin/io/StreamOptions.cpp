#include <veldrin/io/StreamOptions.h>

namespace Veldrin::IO {

SerializationOptions::SerializationOptions() = default;
SerializationOptions::SerializationOptions(SerializationOptions const&) = default;
SerializationOptions::SerializationOptions(SerializationOptions&&) noexcept = default;
SerializationOptions& SerializationOptions::operator=(SerializationOptions const&) = default;
SerializationOptions& SerializationOptions::operator=(SerializationOptions&&) noexcept = default;
SerializationOptions::~SerializationOptions() = default;

DeserializationOptions::DeserializationOptions() = default;
DeserializationOptions::DeserializationOptions(DeserializationOptions const&) = default;
DeserializationOptions& DeserializationOptions::operator=(DeserializationOptions const&) = default;

} // namespace Veldrin::IO
