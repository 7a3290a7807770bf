# One object library a folder. Sources are found, so that adding a file needs no edit here. What a layer may
# use are the libraries it names; tests/architecture checks that no include goes upwards.

function(korvane_precompile target)
    if(KORVANE_PCH)
        target_precompile_headers(${target} PRIVATE
            <algorithm> <atomic> <cstdint> <functional> <map> <memory> <mutex> <optional> <set> <string>
            <string_view> <unordered_map> <utility> <vector>)
    endif()
endfunction()

# korvane_layer(<name> FOLDER <folder> [USES <layers>...] [LIBRARIES <external libraries>...])
# USES passes on include directories only: all layers are linked into one shared library at the end.
function(korvane_layer name)
    cmake_parse_arguments(LAYER "" "FOLDER" "USES;LIBRARIES" ${ARGN})
    file(GLOB sources CONFIGURE_DEPENDS "${CMAKE_SOURCE_DIR}/src/${LAYER_FOLDER}/*.cpp")
    file(GLOB headers CONFIGURE_DEPENDS "${CMAKE_SOURCE_DIR}/src/${LAYER_FOLDER}/*.h")
    if(NOT sources)
        add_library(${name} INTERFACE)
        target_include_directories(${name} INTERFACE "${CMAKE_SOURCE_DIR}/src")
        return()
    endif()
    add_library(${name} OBJECT ${sources} ${headers})
    target_include_directories(${name} PRIVATE "${CMAKE_SOURCE_DIR}/src")
    target_link_libraries(${name} PRIVATE ${LAYER_LIBRARIES})
    korvane_precompile(${name})
    set_property(GLOBAL APPEND PROPERTY KORVANE_LAYERS ${name})
    set_property(GLOBAL APPEND PROPERTY KORVANE_LIBRARIES ${LAYER_LIBRARIES})
endfunction()
