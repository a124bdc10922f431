#pragma once

/// WAVEMILL_SIMULATOR_API marks what libwavemill_simulator exports. The
/// simulator is a library of its own, built with hidden visibility like the
/// core library, so that programs without hardware can link it and products
/// that never simulate do not carry it.
#if defined(_WIN32)
#if defined(WAVEMILL_SIMULATOR_BUILDING)
#define WAVEMILL_SIMULATOR_API __declspec(dllexport)
#else
#define WAVEMILL_SIMULATOR_API __declspec(dllimport)
#endif
#else
#define WAVEMILL_SIMULATOR_API __attribute__((visibility("default")))
#endif
