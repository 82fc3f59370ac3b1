#pragma once

#include <nexil/JobCancel.h>
#include <nexil/RuntimeMessage.h>
#include <nexil/String.h>
#include <veldrin/io/internal/ByteSink.h>

#include <cstring>
#include <fstream>
#include <new>
#include <stdexcept>
#include <string_view>

/// The shape of every exported function of the stream: do the work, and turn what it throws into false and one message.
namespace Veldrin::IO {

inline bool report(Nexil::RuntimeServices const* services, Nexil::String const& text)
{
    if (services)
        services->logMessage({Nexil::RuntimeMessageCategory::Error, text});
    return false;
}

/// The shape of every entry point: does the work, and turns what it throws into false and a message.
/// ioMessage: what to say when the stream itself fails.
template <class Work>
bool runReported(Nexil::RuntimeServices const* services, Nexil::String const& ioMessage, Work const& work)
{
    try {
        return work();
    } catch (Nexil::String const& text) {
        return report(services, text);
    } catch (WriteFailure const&) {
        return report(services, ioMessage);
    } catch (std::ios_base::failure const&) {
        return report(services, ioMessage);
    } catch (std::bad_alloc const&) {
        throw;
    } catch (std::runtime_error const& error) {
        // A cancelled job is no failure. Of the MessagePack library's errors some are runtime errors too.
        if (std::strcmp(error.what(), Nexil::Internal::kJobCancelledText) == 0)
            return false;
        return report(services, "Unknown msgpack error occurred");
    } catch (...) {
        // Also what a caller's own stream buffer or object class throws.
        return report(services, "Unknown msgpack error occurred");
    }
}

/// The path as the system takes it. Throws `cannotOpen` and the path when a zero byte would cut it short.
[[nodiscard]] inline char const* systemPath(Nexil::String const& path, char const* cannotOpen)
{
    if (path.view().find('\0') != std::string_view::npos)
        throw Nexil::String(cannotOpen) + path;
    return path.c_str();
}

inline constexpr char kCannotOpenForWriting[] = "Cannot open file for writing: ";
inline constexpr char kCannotOpenForReading[] = "Cannot open file for reading: ";

/// Opens a file for reading and works on it.
template <class Work>
bool withInputFile(Nexil::String const& path, Nexil::RuntimeServices const* services, Work const& work)
{
    return runReported(services, Nexil::String("Cannot read from file: ") + path, [&] {
        std::ifstream file(systemPath(path, kCannotOpenForReading), std::ios_base::in | std::ios_base::binary);
        if (!file)
            throw Nexil::String(kCannotOpenForReading) + path;
        return work(file);
    });
}

} // namespace Veldrin::IO
