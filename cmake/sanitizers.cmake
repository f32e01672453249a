# QUILLON_SANITIZE: a list for -fsanitize, for example "address,undefined".
set(QUILLON_SANITIZE "" CACHE STRING "Sanitizers for everything in this build")

if(QUILLON_SANITIZE)
    add_compile_options(-fsanitize=${QUILLON_SANITIZE} -fno-sanitize-recover=all
        -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${QUILLON_SANITIZE})
    # The kernels take minutes to compile here.  The older instruction sets are left
    # to the other builds: they run the code of the fallback and of AVX2 in vectors
    # whose sizes those two have at the ends of rows as well.
    if(CMAKE_SYSTEM_PROCESSOR STREQUAL "x86_64")
        add_compile_definitions("HWY_DISABLED_TARGETS=(HWY_SSSE3|HWY_SSE4)")
    endif()
endif()
