#pragma once

#include <mutex>

namespace VXLog {

// The locks of this library; at most one is held at a time, and under it nothing runs but this library. A child of
// fork() finds both free, whichever thread of its parent held them.
extern std::mutex sinkLock;
extern std::mutex composersLock;

}  // namespace VXLog
