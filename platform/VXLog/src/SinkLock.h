#pragma once

#include <mutex>

namespace VXLog {

// The lock of this library; under it nothing runs but this library. A child of fork() finds it free, whichever thread
// of its parent held it.
extern std::mutex sinkLock;

}  // namespace VXLog
