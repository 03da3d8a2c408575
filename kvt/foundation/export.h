// How a name leaves libkvt.
//
// The library is compiled with hidden visibility, so nothing is exported unless it says so. KVT_EXPORT marks
// what is: functions, static data, and every class whose type information must be the same object in all modules,
// which is each class that is thrown, caught, downcast or has virtual functions that a host calls.
#pragma once

// KVT_HIDDEN takes back a private class that stands inside an exported one.
#if defined(__GNUC__)
#define KVT_EXPORT __attribute__((visibility("default")))
#define KVT_HIDDEN __attribute__((visibility("hidden")))
#else
#define KVT_EXPORT
#define KVT_HIDDEN
#endif
