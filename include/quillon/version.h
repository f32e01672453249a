/** @file version.h
 *
 * The version of these headers.  The build takes its own version from here.
 *
 * Versions are semantic: a program built against one version runs with every later
 * library of the same major version.
 */
#ifndef QUILLON_VERSION_H
#define QUILLON_VERSION_H

#define QUILLON_VERSION_MAJOR 1
#define QUILLON_VERSION_MINOR 0
#define QUILLON_VERSION_PATCH 0

/** A version as one number; minor and patch are below 1000. */
#define QUILLON_MAKE_VERSION(major, minor, patch) ((major)*1000000 + (minor)*1000 + (patch))

/** The version of these headers as one number. */
#define QUILLON_VERSION                                                                            \
    QUILLON_MAKE_VERSION(QUILLON_VERSION_MAJOR, QUILLON_VERSION_MINOR, QUILLON_VERSION_PATCH)

/** The version of these headers as text, such as "1.0.0". */
#define QUILLON_VERSION_STRING                                                                     \
    QUILLON_TEXT_OF(QUILLON_VERSION_MAJOR)                                                         \
    "." QUILLON_TEXT_OF(QUILLON_VERSION_MINOR) "." QUILLON_TEXT_OF(QUILLON_VERSION_PATCH)

/** @cond */
#define QUILLON_TEXT_OF(number) QUILLON_TEXT(number)
#define QUILLON_TEXT(number) #number
/** @endcond */

/** True when these headers are of the given version, or of a later one with the same major
 * version.  Works in the preprocessor:
 *
 *     #if !QUILLON_VERSION_AT_LEAST(1, 0, 0)
 *     #error "libquillon 1.0 or a later 1.x is needed"
 *     #endif
 */
#define QUILLON_VERSION_AT_LEAST(major, minor, patch)                                              \
    (QUILLON_VERSION_MAJOR == (major) &&                                                           \
     QUILLON_VERSION >= QUILLON_MAKE_VERSION(major, minor, patch))

#endif /* QUILLON_VERSION_H */
