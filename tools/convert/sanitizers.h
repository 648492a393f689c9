#pragma once

// The one place that knows about sanitizers: GCC says so by a macro, Clang by a feature.
#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ORV_CHECKS_ADDRESSES
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define ORV_CHECKS_ADDRESSES
#endif
