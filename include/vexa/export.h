// SPDX-License-Identifier: Apache-2.0
// Marks what the shared libraries hand out; everything else stays hidden.
#pragma once

#define VEXA_API __attribute__((visibility("default")))

// Lock contracts, checked by clang's -Wthread-safety and empty elsewhere.
#if defined(__clang__)
#define VEXA_THREAD_ATTRIBUTE(x) __attribute__((x))
#else
#define VEXA_THREAD_ATTRIBUTE(x)
#endif
#define VEXA_LOCK VEXA_THREAD_ATTRIBUTE(capability("mutex"))
#define VEXA_GUARDED_BY(x) VEXA_THREAD_ATTRIBUTE(guarded_by(x))
#define VEXA_REQUIRES(...) VEXA_THREAD_ATTRIBUTE(requires_capability(__VA_ARGS__))
#define VEXA_ACQUIRE(...) VEXA_THREAD_ATTRIBUTE(acquire_capability(__VA_ARGS__))
#define VEXA_RELEASE(...) VEXA_THREAD_ATTRIBUTE(release_capability(__VA_ARGS__))
#define VEXA_EXCLUDES(...) VEXA_THREAD_ATTRIBUTE(locks_excluded(__VA_ARGS__))
