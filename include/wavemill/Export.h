#pragma once

/// WAVEMILL_API marks the classes and functions that libwavemill exports.
/// The library is built with hidden visibility; everything an application
/// calls, derives from or catches carries this mark so that its type
/// information is shared across module boundaries.
#if defined(_WIN32)
#if defined(WAVEMILL_BUILDING)
#define WAVEMILL_API __declspec(dllexport)
#else
#define WAVEMILL_API __declspec(dllimport)
#endif
#else
#define WAVEMILL_API __attribute__((visibility("default")))
#endif
