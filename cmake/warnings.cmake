# Warnings for the project's own targets; errors where QUILLON_WERROR is set.
option(QUILLON_WERROR "Treat warnings as errors" OFF)

add_library(quillon_warnings INTERFACE)
target_compile_options(quillon_warnings INTERFACE -Wall -Wextra -Wconversion -Wshadow
    $<$<BOOL:${QUILLON_WERROR}>:-Werror>)
