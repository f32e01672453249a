/** @file export.h
 *
 * The export mark and the linkage of every declaration of libquillon.
 */
#ifndef QUILLON_EXPORT_H
#define QUILLON_EXPORT_H

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

#endif /* QUILLON_EXPORT_H */
