#include "Command.h"
#include "Console.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <exception>
#include <new>
#include <string>
#include <string_view>

namespace {

using namespace Zon;

ExitCode runSubcommand(Run const& run)
{
    try {
        auto const code = run();
        // A report that did not arrive is a failure whatever it said.
        if (std::fflush(stdout) != 0 || std::ferror(stdout))
            throw Failure("standard output: " + errorText(errno));
        return code;
    } catch (Failure const& failure) {
        error(failure.what());
    } catch (std::bad_alloc const&) {
        error("out of memory");
    } catch (std::exception const& exception) {
        error(exception.what());
    }
    return kFailure;
}

} // namespace

int main(int argumentCount, char** arguments)
{
    CLI::App app("Reads, writes and compares zon files: geometry objects in a compressed, checked stream.", "zon");
    app.require_subcommand(1);
    app.set_version_flag("--version", "zon " ZON_VERSION);
    app.footer("Exit codes: 0 done; 1 differences, a damaged file, an invalid object, faults of a mesh, or names that "
               "resolve to nothing; 2 wrong usage, or a file that cannot be read or written.\n'zon SUBCOMMAND --help' "
               "tells more.");
    Run run;
    addImport(app, run);
    addExport(app, run);
    addMake(app, run);
    addInfo(app, run);
    addDump(app, run);
    addVerify(app, run);
    addDiff(app, run);
    addTags(app, run);
    addTag(app, run);
    addNormals(app, run);
    addDiagnose(app, run);
    addStrands(app, run);
    addValidate(app, run);
    addVolume(app, run);
    try {
        app.parse(argumentCount, arguments);
    } catch (CLI::ParseError const& wrongUsage) {
        auto const unknown = app.remaining(true);
        if (!unknown.empty() && std::string_view(wrongUsage.what()) == "A subcommand is required") {
            error("there is no subcommand '" + unknown[0] + "'");
            return kFailure;
        }
        if (app.exit(wrongUsage) == 0)
            return kDone;
        if (std::ranges::any_of(unknown, [](std::string const& word) { return word.starts_with('-'); }))
            std::fputs("What begins with '-' and is no option stands behind '--'.\n", stderr);
        return kFailure;
    }
    return runSubcommand(run);
}
