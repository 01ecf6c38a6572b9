// Writes a file as a whole or not at all.
#pragma once

#include <csignal>
#include <string>

namespace inventory {

// Blocks the signals that end the program, so that it never ends in the middle of its output.
class BlockedSignals {
public:
    BlockedSignals();
    ~BlockedSignals() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
    BlockedSignals(const BlockedSignals&) = delete;
    BlockedSignals& operator=(const BlockedSignals&) = delete;

private:
    sigset_t before_ {};
};

// Replaces the file, or the one that a symbolic link leads to, by a new file with this content: another program sees
// the old file or the new one. The new file has the permissions that the umask leaves. A device or a FIFO is not
// replaced but written to. Throws std::system_error; then the old file is as it was, and no temporary file is left.
void replaceFile(const std::string& name, const std::string& content);

// Whether nobody reads any more what goes to standard output.
bool isOutputClosed();

}  // namespace inventory
