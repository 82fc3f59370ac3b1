#pragma once

/// VELDRIN_PLATFORM_API marks what libVeldrinPlatform exports; everything else stays hidden.
#if defined(_WIN32)
#    if defined(VELDRIN_PLATFORM_BUILD)
#        define VELDRIN_PLATFORM_API __declspec(dllexport)
#    else
#        define VELDRIN_PLATFORM_API __declspec(dllimport)
#    endif
#else
#    define VELDRIN_PLATFORM_API __attribute__((visibility("default")))
#endif
