#pragma once

// Attributes for clang's thread-safety analysis, which checks the library's own build. Empty everywhere else.
#ifdef IC_CHECK_THREAD_SAFETY
#define IC_GUARDED __attribute__((guarded_by(mutex)))
#define IC_SCOPED __attribute__((scoped_lockable))
#define IC_ACQUIRES __attribute__((acquire_capability(nodeMutex)))
#define IC_RELEASES __attribute__((release_capability()))
#else
#define IC_GUARDED
#define IC_SCOPED
#define IC_ACQUIRES
#define IC_RELEASES
#endif
