// The thread that writes the text and clears it.
#include "notice.h"

#include <unistd.h>

#include <chrono>
#include <iostream>

namespace inventory {

Notice::Notice(std::string text) : text_(std::move(text))
{
    if (isatty(STDERR_FILENO) == 0)
        return;
    std::unique_lock<std::mutex> guard(mutex_);
    thread_ = std::thread([this] { wait(); });
    // Until it waits: reading an export calls fork(), and a thread that starts may hold locks of the system.
    over_.wait(guard, [this] { return isWaiting_; });
}

Notice::~Notice()
{
    {
        const std::lock_guard<std::mutex> guard(mutex_);
        isOver_ = true;
    }
    over_.notify_one();
    if (thread_.joinable())
        thread_.join();
}

void Notice::wait()
{
    std::unique_lock<std::mutex> guard(mutex_);
    isWaiting_ = true;
    over_.notify_one();
    if (over_.wait_for(guard, std::chrono::milliseconds(500), [this] { return isOver_; }))
        return;
    std::cerr << text_ << std::flush;
    over_.wait(guard, [this] { return isOver_; });
    std::cerr << '\r' << std::string(text_.size(), ' ') << '\r' << std::flush;
}

}  // namespace inventory
