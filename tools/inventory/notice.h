// Says on a terminal what takes long.
#pragma once

#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace inventory {

// If standard error is a terminal and this object lives for more than half a second, the text stands there until its
// end.
class Notice {
public:
    explicit Notice(std::string text);
    ~Notice();
    Notice(const Notice&) = delete;
    Notice& operator=(const Notice&) = delete;

private:
    void wait();

    std::string text_;
    std::mutex mutex_;
    std::condition_variable over_;
    bool isWaiting_ = false;
    bool isOver_ = false;
    std::thread thread_;
};

}  // namespace inventory
