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

# Every header compiles alone: one tiny source a header, checked without making objects that anybody links.
function(korvane_check_headers)
    file(GLOB_RECURSE headers CONFIGURE_DEPENDS RELATIVE "${CMAKE_SOURCE_DIR}/src" "${CMAKE_SOURCE_DIR}/src/*.h")
    set(sources "")
    foreach(header IN LISTS headers)
        string(REPLACE "/" "_" name "${header}")
        set(source "${CMAKE_BINARY_DIR}/headers/${name}.cpp")
        file(CONFIGURE OUTPUT "${source}" CONTENT "#include \"${header}\" // IWYU pragma: keep\n" @ONLY)
        list(APPEND sources "${source}")
    endforeach()
    add_library(korvane_headers OBJECT EXCLUDE_FROM_ALL ${sources})
    target_include_directories(korvane_headers PRIVATE "${CMAKE_SOURCE_DIR}/src")
    get_property(libraries GLOBAL PROPERTY KORVANE_LIBRARIES)
    list(REMOVE_DUPLICATES libraries)
    target_link_libraries(korvane_headers PRIVATE ${libraries})
endfunction()
