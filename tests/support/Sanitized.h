// Whether this is a build with a sanitizer that has an allocator of its own.
#pragma once

#if defined(__has_feature)
#define TVR_HAS_FEATURE(name) __has_feature(name)
#else
#define TVR_HAS_FEATURE(name) 0
#endif
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__) || TVR_HAS_FEATURE(address_sanitizer) ||             \
    TVR_HAS_FEATURE(thread_sanitizer)
#define TVR_SANITIZED 1
#else
#define TVR_SANITIZED 0
#endif
