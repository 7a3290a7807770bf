#pragma once

/// Names of clang's thread-safety attributes (-Wthread-safety); nothing with other compilers.
#if defined(__clang__)
#define KORVANE_THREAD_ATTRIBUTE(x) __attribute__((x))
#else
#define KORVANE_THREAD_ATTRIBUTE(x)
#endif

/// On a class: an object of it is a lock, "mutex" in the compiler's messages.
#define KORVANE_CAPABILITY(name) KORVANE_THREAD_ATTRIBUTE(capability(name))
/// On a class: takes a lock for its own lifetime.
#define KORVANE_SCOPED_CAPABILITY KORVANE_THREAD_ATTRIBUTE(scoped_lockable)
/// On a field: read and written only while the lock is held.
#define KORVANE_GUARDED_BY(lock) KORVANE_THREAD_ATTRIBUTE(guarded_by(lock))
/// On a pointer field: what it points at is guarded, not the pointer.
#define KORVANE_PT_GUARDED_BY(lock) KORVANE_THREAD_ATTRIBUTE(pt_guarded_by(lock))
/// On a function: the caller holds the lock.
#define KORVANE_REQUIRES(...) KORVANE_THREAD_ATTRIBUTE(requires_capability(__VA_ARGS__))
#define KORVANE_REQUIRES_SHARED(...) KORVANE_THREAD_ATTRIBUTE(requires_shared_capability(__VA_ARGS__))
/// On a function: the caller does not hold the lock.
#define KORVANE_EXCLUDES(...) KORVANE_THREAD_ATTRIBUTE(locks_excluded(__VA_ARGS__))
/// On a function: takes, gives back, or tries to take the lock.
#define KORVANE_ACQUIRE(...) KORVANE_THREAD_ATTRIBUTE(acquire_capability(__VA_ARGS__))
#define KORVANE_ACQUIRE_SHARED(...) KORVANE_THREAD_ATTRIBUTE(acquire_shared_capability(__VA_ARGS__))
#define KORVANE_RELEASE(...) KORVANE_THREAD_ATTRIBUTE(release_capability(__VA_ARGS__))
#define KORVANE_RELEASE_SHARED(...) KORVANE_THREAD_ATTRIBUTE(release_shared_capability(__VA_ARGS__))
#define KORVANE_TRY_ACQUIRE(...) KORVANE_THREAD_ATTRIBUTE(try_acquire_capability(__VA_ARGS__))
/// On a function whose locking the compiler cannot follow; the comment beside it says why it is right.
#define KORVANE_NO_THREAD_SAFETY_ANALYSIS KORVANE_THREAD_ATTRIBUTE(no_thread_safety_analysis)
