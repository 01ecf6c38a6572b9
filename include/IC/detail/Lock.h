#pragma once

// The end of IC/Node.h: Node::Lock.

namespace IC {

/// Holds a node's lock for as long as it lives. Re-entrant: its thread may call every operation of the node. Throws
/// what the mutex throws.
///
///     const Lock lock(mutex);                    // in a member function of a class derived from Node
class IC_SCOPED Node::Lock {
public:
    /// Waits until the mutex is free.
    IC_ACQUIRES explicit Lock(ZQ::Mutex& nodeMutex) : mutex_(nodeMutex)
    {
        mutex_.lock(0xFFFFFFFF);  // no time-out, so the result is not needed
    }
    /// Releases it.
    IC_RELEASES ~Lock() { mutex_.unlock(); }
    /// Neither copied nor assigned.
    Lock(const Lock&) = delete;
    Lock& operator=(const Lock&) = delete;

private:
    ZQ::Mutex& mutex_;
};

}  // namespace IC
