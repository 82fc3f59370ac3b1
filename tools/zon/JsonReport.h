#pragma once

#include <nlohmann/json.hpp>

namespace Zon {

/// Keys stay in the order in which they are written.
using Json = nlohmann::ordered_json;

/// Prints a report on stdout. Bytes of names that are no UTF-8 come as U+FFFD.
void printReport(Json const& report);

} // namespace Zon
