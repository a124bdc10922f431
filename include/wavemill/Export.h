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

/// WAVEMILL_LOCAL keeps a symbol inside the module that compiled it, even when
/// that module exports everything else: each module then has its own copy,
/// which is how a class template finds out which module instantiated it.
#if defined(_WIN32)
#define WAVEMILL_LOCAL
#else
#define WAVEMILL_LOCAL __attribute__((visibility("hidden")))
#endif
