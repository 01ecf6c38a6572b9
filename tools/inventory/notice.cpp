// The thread that writes the text and clears it.
#include "notice.h"

#include <unistd.h>

#include <chrono>
#include <iostream>

namespace inventory {

Notice::Notice(std::string text) : text_(std::move(text))
{
    if (isatty(STDERR_FILENO) != 0)
        thread_ = std::thread([this] { wait(); });
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
    if (over_.wait_for(guard, std::chrono::milliseconds(500), [this] { return isOver_; }))
        return;
    std::cerr << text_ << std::flush;
    over_.wait(guard, [this] { return isOver_; });
    std::cerr << '\r' << std::string(text_.size(), ' ') << '\r' << std::flush;
}

}  // namespace inventory
