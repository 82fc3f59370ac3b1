#include <vld/Component.h>

namespace VLD {

Base::~Base() = default;
Component::~Component() = default;

} // namespace VLD
