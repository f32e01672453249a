# Which instruction sets the kernels are compiled for: those of Highway but for
# QUILLON_WITHOUT_TARGETS, for the library and its tests alike.
set(QUILLON_WITHOUT_TARGETS "" CACHE STRING
    "Instruction sets to leave out, by Highway's names, for example SSSE3;SSE4")

set(without ${QUILLON_WITHOUT_TARGETS})
if(CMAKE_SYSTEM_PROCESSOR STREQUAL "aarch64")
    # GCC 12.2 crashes on them; NEON serves there.
    list(APPEND without SVE SVE2 SVE_256 SVE2_128)
elseif(QUILLON_SANITIZE AND CMAKE_SYSTEM_PROCESSOR STREQUAL "x86_64")
    # The kernels take minutes to compile here.  The older instruction sets are left
    # to the other builds: they run the code of the fallback and of AVX2 in vectors
    # whose sizes those two have at the ends of rows as well.
    list(APPEND without SSSE3 SSE4)
endif()

add_library(quillon_targets INTERFACE)
if(without)
    list(TRANSFORM without PREPEND HWY_)
    list(JOIN without "|" without)
    target_compile_definitions(quillon_targets INTERFACE "HWY_DISABLED_TARGETS=(${without})")
endif()
