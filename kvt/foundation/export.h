// How a name leaves libkvt.
//
// The library is compiled with hidden visibility, so nothing is exported unless it says so. KVT_EXPORT marks
// what is: functions, static data, and every class whose type information must be the same object in all modules,
// which is each class that is thrown, caught, downcast or has virtual functions that a host calls.
#pragma once

#if defined(__GNUC__)
#define KVT_EXPORT __attribute__((visibility("default")))
#else
#define KVT_EXPORT
#endif
