#include "OutputFile.h"

#include "Command.h"
#include "Console.h"

#include <fmt/format.h>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstring>

namespace Zon {

namespace {

    namespace fs = std::filesystem;

    // The named temporary file that a signal has to remove; "" when there is none.
    char pendingPath[4096];

    extern "C" void removePendingAndStop(int signalNumber)
    {
        if (pendingPath[0])
            unlink(pendingPath);
        std::signal(signalNumber, SIG_DFL);
        std::raise(signalNumber);
    }

    void removeOnSignals(fs::path const& path)
    {
        if (path.native().size() >= sizeof pendingPath)
            return;
        std::memcpy(pendingPath, path.c_str(), path.native().size() + 1);
        for (int const signalNumber : {SIGINT, SIGTERM, SIGHUP})
            std::signal(signalNumber, removePendingAndStop);
    }

    void keepOnSignals() noexcept
    {
        pendingPath[0] = '\0';
    }

    fs::path folderOf(fs::path const& path)
    {
        return path.has_parent_path() ? path.parent_path() : fs::path(".");
    }

    bool isTemporaryName(std::string const& name)
    {
        return name.starts_with(".zon-") && name.ends_with(".tmp");
    }

    /// Takes away what killed programs left in a folder: temporary files that nobody holds locked any more.
    void removeAbandoned(fs::path const& folder)
    {
        std::error_code error;
        fs::directory_iterator entry(folder, error);
        for (fs::directory_iterator const end; !error && entry != end; entry.increment(error)) {
            if (!isTemporaryName(entry->path().filename().native()))
                continue;
            int const file = open(entry->path().c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC);
            if (file < 0)
                continue;
            if (flock(file, LOCK_EX | LOCK_NB) == 0)
                unlink(entry->path().c_str());
            close(file);
        }
    }

    unsigned int modeOfNewFiles()
    {
        mode_t const mask = umask(0);
        umask(mask);
        return 0666u & ~mask;
    }

} // namespace

OutputFile::OutputFile(std::string const& target) : target_(target), finalPath_(target)
{
    if (target.empty())
        throw Failure("the output file has no name");
    unsigned int mode = modeOfNewFiles();
    struct stat status {};
    if (stat(target.c_str(), &status) == 0) {
        if (S_ISDIR(status.st_mode))
            fail(EISDIR);
        if (!S_ISREG(status.st_mode)) {
            writePath_ = target;
            return;
        }
        if (access(target.c_str(), W_OK) != 0)
            fail(errno);
        mode = status.st_mode & 07777u;
        // A link stays a link: the file behind it is replaced.
        std::error_code ignored;
        if (auto const real = fs::canonical(finalPath_, ignored); !real.empty())
            finalPath_ = real;
    } else if (errno != ENOENT) {
        fail(errno);
    }
    removeAbandoned(folderOf(finalPath_));
    openUnnamed(mode);
    while (descriptor_ < 0)
        openNamed(mode);
}

OutputFile::~OutputFile()
{
    if (!temporary_.empty()) {
        unlink(temporary_.c_str());
        keepOnSignals();
    }
    if (descriptor_ >= 0)
        close(descriptor_);
}

void OutputFile::fail(int errorNumber) const
{
    throw Failure(fmt::format("{}: cannot be written: {}", target_, errorText(errorNumber)));
}

void OutputFile::openUnnamed(unsigned int mode)
{
    descriptor_ = open(folderOf(finalPath_).c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
    if (descriptor_ < 0) {
        // Old kernels take the flag for an attempt to write to a folder.
        if (errno != EOPNOTSUPP && errno != EISDIR && errno != EINVAL)
            fail(errno);
        return;
    }
    fchmod(descriptor_, static_cast<mode_t>(mode));
    flock(descriptor_, LOCK_EX);
    writePath_ = fmt::format("/proc/self/fd/{}", descriptor_);
    if (access(writePath_.c_str(), F_OK) != 0) {
        close(descriptor_);
        descriptor_ = -1;
    }
}

void OutputFile::openNamed(unsigned int mode)
{
    auto const path = freshName();
    descriptor_ = open(path.c_str(), O_CREAT | O_EXCL | O_RDWR | O_CLOEXEC, 0600);
    if (descriptor_ < 0)
        fail(errno);
    // Another program may have come upon the file before it was locked, and taken it for an abandoned one.
    struct stat status {};
    if (flock(descriptor_, LOCK_EX) == 0 && fstat(descriptor_, &status) == 0 && status.st_nlink == 0) {
        close(descriptor_);
        descriptor_ = -1;
        return;
    }
    temporary_ = path;
    removeOnSignals(temporary_);
    fchmod(descriptor_, static_cast<mode_t>(mode));
    writePath_ = temporary_.native();
}

fs::path OutputFile::freshName() const
{
    static std::atomic<unsigned int> counter{0};
    for (;;) {
        auto path = finalPath_.parent_path() / fmt::format(".zon-{}-{}.tmp", getpid(), counter++);
        struct stat status {};
        if (lstat(path.c_str(), &status) != 0)
            return path;
    }
}

void OutputFile::commit()
{
    if (descriptor_ < 0)
        return;
    if (fsync(descriptor_) != 0)
        fail(errno);
    if (temporary_.empty()) {
        // A file without a name can only be linked to a free one, so it gets a name for the blink of the renaming.
        auto const path = freshName();
        if (linkat(AT_FDCWD, writePath_.c_str(), AT_FDCWD, path.c_str(), AT_SYMLINK_FOLLOW) != 0)
            fail(errno);
        temporary_ = path;
    }
    if (rename(temporary_.c_str(), finalPath_.c_str()) != 0)
        fail(errno);
    temporary_.clear();
    keepOnSignals();
    // The renaming itself reaches the disk with the folder; file systems that cannot flush folders are let be.
    if (int const opened = open(folderOf(finalPath_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC); opened >= 0) {
        fsync(opened);
        close(opened);
    }
}

void checkIsOtherFile(std::string const& input, std::string const& output)
{
    std::error_code isNoFile;
    if (fs::equivalent(input, output, isNoFile))
        throw Failure(fmt::format("{}: is the file that is read", output));
}

} // namespace Zon
