/** @file quillonTypes.h
 *
 * Integer types and the export mark: what every header of libquillon shares.
 * Usable from C99 and from C++.
 */
#ifndef QUILLON_TYPES_H
#define QUILLON_TYPES_H

#include <stdbool.h>
#include <stddef.h>
#include <stdint.h>

typedef uint8_t uint8;
typedef uint16_t uint16;
typedef uint32_t uint32;
typedef int32_t int32;

/** Marks what the shared library exports; everything else in it is hidden. */
#if defined(__GNUC__)
#define QUILLON_API __attribute__((visibility("default")))
#else
#define QUILLON_API
#endif

#if defined(__cplusplus)
#define QUILLON_BEGIN_DECLS extern "C" {
#define QUILLON_END_DECLS }
#else
#define QUILLON_BEGIN_DECLS
#define QUILLON_END_DECLS
#endif

#endif /* QUILLON_TYPES_H */
