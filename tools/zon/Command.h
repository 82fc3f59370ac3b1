#pragma once

#include <functional>
#include <stdexcept>

namespace CLI {
class App;
}

/// What the subcommands share with main: how they are registered, how they end.
namespace Zon {

/// Exit codes of the program; scripts rely on them.
enum ExitCode : int {
    kDone = 0,
    kFindings =
        1, ///< differences, a damaged file, an invalid object, faults of a mesh, or names that resolve to nothing
    kFailure = 2, ///< wrong usage, or a file that cannot be read or written
};

/// Ends a subcommand with `kFailure`; the text says which file and why.
class Failure : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// The chosen subcommand with its arguments; gives the exit code.
using Run = std::function<ExitCode()>;

// Each adds one subcommand and, when the command line names it, stores in `run` what it does.
void addImport(CLI::App& app, Run& run);
void addExport(CLI::App& app, Run& run);
void addMake(CLI::App& app, Run& run);
void addInfo(CLI::App& app, Run& run);
void addDump(CLI::App& app, Run& run);
void addVerify(CLI::App& app, Run& run);
void addDiff(CLI::App& app, Run& run);
void addTags(CLI::App& app, Run& run);
void addTag(CLI::App& app, Run& run);
void addNormals(CLI::App& app, Run& run);
void addDiagnose(CLI::App& app, Run& run);
void addStrands(CLI::App& app, Run& run);
void addValidate(CLI::App& app, Run& run);
void addVolume(CLI::App& app, Run& run);

} // namespace Zon
