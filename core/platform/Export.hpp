#pragma once
// Marks the classes and functions that belong to the installed C++ interface of
// the library: their symbols keep default visibility even when the rest of a
// build hides its symbols.
#if defined(__GNUC__) || defined(__clang__)
#define DEXMOR_API __attribute__((visibility("default")))
#else
#define DEXMOR_API
#endif
