/* Comparisons of the version, for the preprocessor alone. */
#include <quillon/version.h>

#define MAJOR QUILLON_VERSION_MAJOR
#define MINOR QUILLON_VERSION_MINOR
#define PATCH QUILLON_VERSION_PATCH

#if !QUILLON_VERSION_AT_LEAST(MAJOR, 0, 0) || !QUILLON_VERSION_AT_LEAST(MAJOR, MINOR, PATCH)
#error "refuses the present version, or the first one of the same major version"
#endif
#if QUILLON_VERSION_AT_LEAST(MAJOR, MINOR, PATCH + 1) ||                                           \
    QUILLON_VERSION_AT_LEAST(MAJOR, MINOR + 1, 0) || QUILLON_VERSION_AT_LEAST(MAJOR + 1, 0, 0)
#error "accepts a later version"
#endif
#if QUILLON_VERSION_AT_LEAST(MAJOR - 1, 999, 999)
#error "accepts an earlier major version"
#endif
#if QUILLON_VERSION != QUILLON_MAKE_VERSION(MAJOR, MINOR, PATCH) ||                                \
    QUILLON_MAKE_VERSION(1, 2, 999) >= QUILLON_MAKE_VERSION(1, 3, 0) ||                            \
    QUILLON_MAKE_VERSION(1, 999, 999) >= QUILLON_MAKE_VERSION(2, 0, 0)
#error "numbers are not in the order of versions"
#endif
