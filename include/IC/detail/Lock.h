#pragma once

// The end of IC/Node.h: Node::Lock.

namespace IC {

class IC_ANNOTATION(scoped_lockable) Node::Lock {
public:
    // Does not ask whether the lock was obtained: with this time-out lock() waits for ever.
    explicit Lock(ZQ::Mutex& nodeMutex) IC_ANNOTATION(acquire_capability(nodeMutex)) : mutex_(nodeMutex)
    {
        mutex_.lock(0xFFFFFFFF);
    }
    ~Lock() IC_ANNOTATION(release_capability()) { mutex_.unlock(); }
    Lock(const Lock&) = delete;
    Lock& operator=(const Lock&) = delete;

private:
    ZQ::Mutex& mutex_;
};

}  // namespace IC
