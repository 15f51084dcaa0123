#ifndef HPNSSAEXPORT_H
#define HPNSSAEXPORT_H

// Marks what a shared build of the library shows to its clients. Nothing has to be defined for a
// static build or for compiling the sources into another program; the project's own build sets
// HPNSSA_BUILD_SHARED while it makes the shared library, and a client of the DLL form sets
// HPNSSA_USE_SHARED.
#if defined(_WIN32)
#if defined(HPNSSA_BUILD_SHARED)
#define HPNSSA_EXPORT __declspec(dllexport)
#elif defined(HPNSSA_USE_SHARED)
#define HPNSSA_EXPORT __declspec(dllimport)
#else
#define HPNSSA_EXPORT
#endif
#elif defined(__GNUC__)
#define HPNSSA_EXPORT __attribute__((visibility("default")))
#else
#define HPNSSA_EXPORT
#endif

#endif
