#pragma once

// Annotations by which Clang's -Wthread-safety checks at compile time that guarded fields are only
// touched under their mutex. Empty for every other compiler.

#if defined(__clang__)
#define KVR_THREAD_ANNOTATION(x) __attribute__((x))
#else
#define KVR_THREAD_ANNOTATION(x)
#endif

#define KVR_CAPABILITY(name) KVR_THREAD_ANNOTATION(capability(name))
#define KVR_SCOPED_CAPABILITY KVR_THREAD_ANNOTATION(scoped_lockable)
#define KVR_GUARDED_BY(mutex) KVR_THREAD_ANNOTATION(guarded_by(mutex))
#define KVR_PT_GUARDED_BY(mutex) KVR_THREAD_ANNOTATION(pt_guarded_by(mutex))
#define KVR_REQUIRES(...) KVR_THREAD_ANNOTATION(requires_capability(__VA_ARGS__))
#define KVR_REQUIRES_SHARED(...) KVR_THREAD_ANNOTATION(requires_shared_capability(__VA_ARGS__))
#define KVR_ACQUIRE(...) KVR_THREAD_ANNOTATION(acquire_capability(__VA_ARGS__))
#define KVR_ACQUIRE_SHARED(...) KVR_THREAD_ANNOTATION(acquire_shared_capability(__VA_ARGS__))
#define KVR_TRY_ACQUIRE(...) KVR_THREAD_ANNOTATION(try_acquire_capability(__VA_ARGS__))
#define KVR_RELEASE(...) KVR_THREAD_ANNOTATION(release_capability(__VA_ARGS__))
#define KVR_RELEASE_SHARED(...) KVR_THREAD_ANNOTATION(release_shared_capability(__VA_ARGS__))
#define KVR_EXCLUDES(...) KVR_THREAD_ANNOTATION(locks_excluded(__VA_ARGS__))
#define KVR_RETURN_CAPABILITY(x) KVR_THREAD_ANNOTATION(lock_returned(x))
#define KVR_NO_THREAD_SAFETY_ANALYSIS KVR_THREAD_ANNOTATION(no_thread_safety_analysis)
