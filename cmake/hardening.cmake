# What makes the two libraries harder to attack, should a fault be left in them or
# in their host.  tests/install/hardening.sh reads it off the built files, and
# docs/reliability.md has what it costs.
option(QUILLON_HARDENING "Harden the libraries: stack, calls, relocations" ON)

add_library(quillon_hardening INTERFACE)
if(NOT QUILLON_HARDENING OR QUILLON_SANITIZE)
    return()
endif()

include(CheckCXXCompilerFlag)
include(CheckCXXSourceCompiles)
include(CheckLinkerFlag)

# By what the compiler knows: -fcf-protection is x86's, -mbranch-protection arm64's.
foreach(flag IN ITEMS -fstack-protector-strong -fstack-clash-protection -fcf-protection=full
        -mbranch-protection=standard)
    string(MAKE_C_IDENTIFIER "has${flag}" has)
    check_cxx_compiler_flag("-Werror ${flag}" ${has})
    if(${has})
        target_compile_options(quillon_hardening INTERFACE ${flag})
    endif()
endforeach()

foreach(flag IN ITEMS relro now noexecstack)
    check_linker_flag(CXX -Wl,-z,${flag} hasLinker_${flag})
    if(hasLinker_${flag})
        target_link_options(quillon_hardening INTERFACE -Wl,-z,${flag})
    endif()
endforeach()

# Level 3 where compiler and C library know it.  Without optimisation there is none.
set(CMAKE_REQUIRED_FLAGS "-O2 -Werror -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=3")
check_cxx_source_compiles("#include <cstring>\nint main() {}" hasFortify3)
unset(CMAKE_REQUIRED_FLAGS)
set(level $<IF:$<BOOL:${hasFortify3}>,3,2>)
target_compile_options(quillon_hardening INTERFACE
    $<$<NOT:$<CONFIG:Debug>>:-U_FORTIFY_SOURCE;-D_FORTIFY_SOURCE=${level}>)
