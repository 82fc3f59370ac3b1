#pragma once

#include <nexil/Array.h>
#include <veldrin/object/Object.h>

#include <string>

namespace support {

/// Objects as JSON in one line, in the form that tests/zon_reader/zon_description.py defines: so that what the library reads
/// can be held against what the second reader reads, and two sets of objects against each other, sharing included.
std::string describeObjects(Nexil::Array<Nexil::Ptr<Veldrin::Object>> const& objects);

} // namespace support
