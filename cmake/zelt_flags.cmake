# Everything about how sources are compiled: language, warnings, optimisation, sanitizers, levels.

option(ZELT_WERROR "Treat warnings as errors" OFF)
set(ZELT_SANITIZE "" CACHE STRING "Sanitizers for the whole build, such as address,undefined or thread")

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

# GCC 12 vectorises the loops of the kernels at -O3 only; -O2 makes them up to twenty times slower.
# The build types of CMake that carry -O2 or -Os are refused rather than quietly slow.
set(CMAKE_CXX_FLAGS_RELEASE "-O3 -DNDEBUG")
if(CMAKE_BUILD_TYPE MATCHES "^(RelWithDebInfo|MinSizeRel)$")
    message(FATAL_ERROR "zelt: build type ${CMAKE_BUILD_TYPE} is not supported, use Release or Debug")
endif()

# Pixels have the same bits on every processor: no fused multiply-add unless it is written.
# Without errno, square roots and the like can be vectorised.
add_compile_options(-ffp-contract=off -fno-math-errno)

add_compile_options(-Wall -Wextra -Wconversion -Wshadow)
if(CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    # A request to vectorise is a hint: loops over strided rows and sanitized ones go without.
    add_compile_options(-Wno-pass-failed)
endif()
if(ZELT_WERROR)
    add_compile_options(-Werror)
endif()

if(ZELT_FUZZ AND NOT CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    message(FATAL_ERROR "zelt: the fuzz targets need Clang (-DCMAKE_CXX_COMPILER=clang++)")
endif()

set(zelt_sanitizers ${ZELT_SANITIZE})
if(ZELT_FUZZ)
    set(zelt_sanitizers address,undefined)
    add_compile_options(-fsanitize=fuzzer-no-link)
endif()
if(zelt_sanitizers)
    set(zelt_sanitize_flags -fsanitize=${zelt_sanitizers} -fno-sanitize-recover=all)
    if(zelt_sanitizers MATCHES "undefined")
        list(APPEND zelt_sanitize_flags -fsanitize=float-cast-overflow)
    endif()
    # GCC sees variables without a value where a sanitizer's own code stands in between.
    if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
        add_compile_options(-Wno-maybe-uninitialized)
    endif()
    # These follow the flags of the build type, so that this -O1 is the one that counts.
    add_compile_options(${zelt_sanitize_flags} -fno-omit-frame-pointer -g -O1)
    add_link_options(${zelt_sanitize_flags})
endif()

# Instruction-set levels: kernels/*_levels.cpp is compiled once for each of them.
set(ZELT_LEVELS v1)
if(CMAKE_SYSTEM_PROCESSOR MATCHES "^(x86_64|AMD64|amd64)$")
    list(APPEND ZELT_LEVELS v3 v4)
    set(ZELT_LEVEL_FLAGS_v1 -march=x86-64)
    set(ZELT_LEVEL_FLAGS_v3 -march=x86-64-v3)
    set(ZELT_LEVEL_FLAGS_v4 -march=x86-64-v4 -mprefer-vector-width=512)
    add_compile_definitions(ZELT_LEVELS_X86=1)
endif()
