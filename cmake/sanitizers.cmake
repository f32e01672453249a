# QUILLON_SANITIZE: a list for -fsanitize, for example "address,undefined".
set(QUILLON_SANITIZE "" CACHE STRING "Sanitizers for everything in this build")

if(QUILLON_SANITIZE)
    add_compile_options(-fsanitize=${QUILLON_SANITIZE} -fno-sanitize-recover=all
        -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${QUILLON_SANITIZE})
endif()
