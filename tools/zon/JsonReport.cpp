#include "JsonReport.h"

#include <fmt/format.h>

namespace Zon {

void printReport(Json const& report)
{
    fmt::print("{}\n", report.dump(2, ' ', false, Json::error_handler_t::replace));
}

} // namespace Zon
