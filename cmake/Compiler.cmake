# Flags that hold for every target of the project.

add_compile_options(-Wall -Wextra -Wpedantic -Wshadow
                    $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor> $<$<COMPILE_LANGUAGE:CXX>:-Woverloaded-virtual>)
# Products and sums round separately everywhere, so that every instruction set gives the bits of the plain form.
add_compile_options(-ffp-contract=off)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
    # GCC 12 reports accesses inside inlined standard containers that cannot happen.
    add_compile_options(-Wno-stringop-overflow -Wno-array-bounds -Wno-restrict)
endif()

if(ORBEK_SANITIZE)
    add_compile_options(-fsanitize=${ORBEK_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${ORBEK_SANITIZE})
endif()
if(ORBEK_LIBFUZZER)
    add_compile_options(-fsanitize=fuzzer-no-link)
endif()

find_program(CCACHE ccache)
if(CCACHE)
    set(CMAKE_C_COMPILER_LAUNCHER ${CCACHE})
    # What it has to overlook to keep what is compiled with precompiled headers.
    set(CMAKE_CXX_COMPILER_LAUNCHER ${CMAKE_COMMAND} -E env CCACHE_SLOPPINESS=pch_defines,time_macros ${CCACHE})
endif()
