#include <nexil/RuntimeMessage.h>

namespace Nexil {

RuntimeServices::~RuntimeServices() = default;

void RuntimeServices::logMessage(RuntimeMessage) const {}

} // namespace Nexil
