// The one export macro of the library: marks every class and function a host may use.
// Everything else is hidden (the library builds with hidden visibility by default).
#pragma once

#if defined(_WIN32)
#  if defined(VEXIL_BUILDING)
#    define VEXIL_API __declspec(dllexport)
#  else
#    define VEXIL_API __declspec(dllimport)
#  endif
#else
#  define VEXIL_API __attribute__((visibility("default")))
#endif

// Plain exported functions have C linkage so a host can resolve them by name.
#if defined(__cplusplus)
#  define VEXIL_EXTERN_C extern "C"
#else
#  define VEXIL_EXTERN_C
#endif
