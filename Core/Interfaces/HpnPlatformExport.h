#ifndef HPNPLATFORMEXPORT_H
#define HPNPLATFORMEXPORT_H

// Marks what a shared build of the platform library shows to its clients. Nothing has to be defined
// for a static build or for compiling the sources into another program; the project's own build
// sets HPNPLATFORM_BUILD_SHARED while it makes the shared library, and a client of the DLL form
// sets HPNPLATFORM_USE_SHARED.
#if defined(_WIN32)
#if defined(HPNPLATFORM_BUILD_SHARED)
#define HPNPLATFORM_EXPORT __declspec(dllexport)
#elif defined(HPNPLATFORM_USE_SHARED)
#define HPNPLATFORM_EXPORT __declspec(dllimport)
#else
#define HPNPLATFORM_EXPORT
#endif
#elif defined(__GNUC__)
#define HPNPLATFORM_EXPORT __attribute__((visibility("default")))
#else
#define HPNPLATFORM_EXPORT
#endif

#endif
