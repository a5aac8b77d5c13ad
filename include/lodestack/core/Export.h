// Symbol visibility of the shared library.
//
// The library is built with hidden visibility: only what carries
// LODESTACK_EXPORT is part of liblodestack.so.1's interface. Public classes
// and free functions are marked with it; everything under src/ stays local.
#ifndef LODESTACK_CORE_EXPORT_H
#define LODESTACK_CORE_EXPORT_H

#if defined(__GNUC__) || defined(__clang__)
#define LODESTACK_EXPORT __attribute__((visibility("default")))
#define LODESTACK_LOCAL __attribute__((visibility("hidden")))
#else
#define LODESTACK_EXPORT
#define LODESTACK_LOCAL
#endif

#endif  // LODESTACK_CORE_EXPORT_H
