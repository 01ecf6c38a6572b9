#pragma once

#include <mutex>

namespace VXLog {

// The locks of this library. A thread holds at most one of them at a time, and under it only this library's code runs.
// fork() acquires both and releases them in parent and child, so a child finds them free.
extern std::mutex sinkLock;
extern std::mutex composersLock;

}  // namespace VXLog
