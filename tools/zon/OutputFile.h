#pragma once

#include <filesystem>
#include <string>

namespace Zon {

/// A file that appears under its name complete or not at all.
///
///     OutputFile file("bunny.zon");
///     write(file.pathToWrite());   // any number of times, by anything that opens a path
///     file.commit();
///
/// The bytes go to a file without a name in the target's folder, so that a crash or a full disk leaves the old file and
/// nothing else. `commit` flushes them to the disk, then puts them in the target's place. Where the file system has no
/// such files, a named one stands in, which goes away with this object and on the usual signals. Named ones are locked, so
/// that those which a killed program left are known, and taken away by the next one that writes to the folder.
/// A target that is no ordinary file (a pipe, /dev/null) is written as it is.
/// Errors: Failure with the target's name and the system's reason.
class OutputFile {
public:
    explicit OutputFile(std::string const& target);
    OutputFile(OutputFile const&) = delete;
    OutputFile& operator=(OutputFile const&) = delete;
    ~OutputFile();

    /// What writers open.
    [[nodiscard]] std::string const& pathToWrite() const noexcept { return writePath_; }
    /// The name that the user gave.
    [[nodiscard]] std::string const& target() const noexcept { return target_; }

    void commit();

private:
    [[noreturn]] void fail(int errorNumber) const;
    void openUnnamed(unsigned int mode);
    /// Opens nothing when somebody took the file away again at once.
    void openNamed(unsigned int mode);
    [[nodiscard]] std::filesystem::path freshName() const;

    std::string target_;
    std::filesystem::path finalPath_;
    std::filesystem::path temporary_; // "" while there is no named file
    std::string writePath_;
    int descriptor_ = -1;
};

/// Throws Failure when both names lead to one file, which writing would take away before anybody has compared.
void checkIsOtherFile(std::string const& input, std::string const& output);

} // namespace Zon
