// A temporary file beside the file, renamed when all of it is on the disk.
#include "output.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string_view>
#include <system_error>
#include <utility>

namespace inventory {

namespace {

namespace fs = std::filesystem;

[[noreturn]] void fail()
{
    throw std::system_error(errno, std::generic_category());
}

class File {
public:
    explicit File(int descriptor) : descriptor_(descriptor)
    {
        if (descriptor < 0)
            fail();
    }
    ~File()
    {
        if (descriptor_ >= 0)
            ::close(descriptor_);
    }
    File(const File&) = delete;
    File& operator=(const File&) = delete;

    void write(std::string_view content) const
    {
        while (!content.empty()) {
            const ssize_t length = ::write(descriptor_, content.data(), content.size());
            if (length < 0 && errno != EINTR)
                fail();
            content.remove_prefix(length < 0 ? 0 : static_cast<std::size_t>(length));
        }
    }
    void flush() const
    {
        if (fsync(descriptor_) != 0)
            fail();
    }
    void allow(mode_t permissions) const
    {
        if (fchmod(descriptor_, permissions) != 0)
            fail();
    }
    void close()
    {
        if (::close(std::exchange(descriptor_, -1)) != 0)
            fail();
    }

private:
    int descriptor_;
};

// Removed with this object unless it was renamed.
class TemporaryFile {
public:
    // A short name, because the name of the file may be as long as a name can be.
    explicit TemporaryFile(const fs::path& folder)
        : name_((folder / ".ic-inventory-XXXXXX").string()),
          file_(mkostemp(name_.data(), O_CLOEXEC))
    {
        const mode_t mask = umask(0);
        umask(mask);
        file_.allow(0666 & ~mask);
    }
    ~TemporaryFile()
    {
        if (!isRenamed_)
            unlink(name_.c_str());
    }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    void become(const fs::path& target, std::string_view content)
    {
        file_.write(content);
        file_.flush();
        file_.close();
        if (std::rename(name_.c_str(), target.c_str()) != 0)
            fail();
        isRenamed_ = true;
    }

private:
    std::string name_;
    File file_;
    bool isRenamed_ = false;
};

}  // namespace

BlockedSignals::BlockedSignals()
{
    sigset_t ends;
    sigemptyset(&ends);
    for (const int signal : {SIGINT, SIGTERM, SIGHUP})
        sigaddset(&ends, signal);
    pthread_sigmask(SIG_BLOCK, &ends, &before_);
}

void replaceFile(const std::string& name, const std::string& content)
{
    const BlockedSignals untilWritten;
    std::error_code missing;
    const fs::file_status status = fs::status(name, missing);
    if (fs::exists(status) && !fs::is_regular_file(status)) {
        File file(open(name.c_str(), O_WRONLY | O_CLOEXEC));
        file.write(content);
        file.close();
        return;
    }
    const fs::path target = fs::exists(status) ? fs::canonical(name) : fs::path(name);
    const fs::path folder = target.has_parent_path() ? target.parent_path() : fs::path(".");
    TemporaryFile(folder).become(target, content);
    // The new name, too, has to be on the disk. Some file systems cannot flush a folder.
    const int descriptor = open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor >= 0) {
        fsync(descriptor);
        close(descriptor);
    }
}

bool isOutputClosed()
{
    pollfd output {STDOUT_FILENO, POLLOUT, 0};
    return poll(&output, 1, 0) == 1 && (output.revents & POLLERR) != 0;
}

}  // namespace inventory
