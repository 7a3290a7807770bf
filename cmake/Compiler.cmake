# Warnings, sanitizers, the compiler cache and the linker: one place for all targets.

find_program(KORVANE_CCACHE ccache)
if(KORVANE_CCACHE)
    set(CMAKE_CXX_COMPILER_LAUNCHER "${KORVANE_CCACHE}")
endif()

find_program(KORVANE_MOLD mold)
if(KORVANE_MOLD)
    add_link_options(-fuse-ld=mold)
endif()

# Doubles agree to the last bit on every machine only without fused multiply-add.
add_compile_options(-ffp-contract=off)
add_compile_options(-Wall -Wextra -Wpedantic -Wnon-virtual-dtor -Woverloaded-virtual -Wshadow -Werror)
if(CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
    add_compile_options($<$<COMPILE_LANGUAGE:CXX>:-Wthread-safety>)
else()
    # g++ 12 reports these two falsely from inside its own library headers.
    add_compile_options($<$<COMPILE_LANGUAGE:CXX>:-Wno-restrict> $<$<COMPILE_LANGUAGE:CXX>:-Wno-stringop-overflow>)
endif()

if(KORVANE_SANITIZE STREQUAL "address")
    add_compile_options(-fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
    # libFuzzer brings instances of std::vector without these marks, and the linker takes either.
    if(NOT KORVANE_FUZZ)
        add_compile_definitions(_GLIBCXX_SANITIZE_VECTOR)
    endif()
    add_link_options(-fsanitize=address,undefined)
elseif(KORVANE_SANITIZE STREQUAL "thread")
    add_compile_options(-fsanitize=thread -fno-omit-frame-pointer)
    add_link_options(-fsanitize=thread)
endif()

# libqpdf's headers ask for this: shared pointers are the standard ones, and its own old ones are not used.
add_compile_definitions(POINTERHOLDER_TRANSITION=4)
