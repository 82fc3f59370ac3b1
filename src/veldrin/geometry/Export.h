#pragma once

/// VELDRIN_API marks what libVeldrinGeometry exports; everything else stays hidden.
#if defined(_WIN32)
#    if defined(VELDRIN_GEOMETRY_BUILD)
#        define VELDRIN_API __declspec(dllexport)
#    else
#        define VELDRIN_API __declspec(dllimport)
#    endif
#else
#    define VELDRIN_API __attribute__((visibility("default")))
#endif
