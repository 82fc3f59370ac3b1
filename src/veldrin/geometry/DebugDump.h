#pragma once

#include <veldrin/geometry/Export.h>
#include <veldrin/object/Object.h>

#include <cstdint>

/// Objects as text, for inspection by eye.
///
///     struct Console : Geometry::Internal::DebugDumpInterface {
///         void write(char const* text, std::uint64_t length) override { std::cout.write(text, std::streamsize(length)); }
///     } console;
///     Geometry::Internal::debugDumpToStream(console, *mesh, 3);
namespace Veldrin::Geometry::Internal {

/// Takes the finished text. Derive from it to send the text to a log, a console or a file.
class VELDRIN_API DebugDumpInterface {
public:
    DebugDumpInterface();
    DebugDumpInterface(DebugDumpInterface const&);
    DebugDumpInterface& operator=(DebugDumpInterface const&);

    virtual ~DebugDumpInterface();
    /// text: `length` bytes, not ended by a zero byte; valid during the call only.
    virtual void write(char const* text, std::uint64_t length) = 0;
};

/// Writes `object` and everything below it, four blanks per level, and calls sink.write once with the whole text.
///
///     {
///         point_component:
///         {
///             count: 3 (unsigned int)
///         }
///         weights: [ 0.5, 1, ... ] 5 elements (array<float>)
///     }
///
/// maxElements: how many elements of an array are written; "..." stands for the others.
/// Numbers are written as standard streams do in the classic locale. Behind a value stands its type: the name of a known
/// type (the value types that files store, arrays of them, the interpolation mode), or the C++ spelling of another one,
/// whose value reads "(unknown data type)". No line end follows the last brace.
/// "..." also stands for objects below 1000 levels, and for objects written before once 10 000 have been repeated.
/// Cost: linear in what is written, memory included. Errors: std::bad_alloc, and what the sink throws.
VELDRIN_API void debugDumpToStream(DebugDumpInterface& sink, Object const& object, unsigned long long maxElements);

} // namespace Veldrin::Geometry::Internal
