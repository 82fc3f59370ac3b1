#include <vld/Cancellation.h>

#include <nexil/JobCancel.h>

namespace VLD {

Nexil::String const exceptionMessage = Nexil::Internal::kJobCancelledText;

} // namespace VLD
