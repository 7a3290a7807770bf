# Message catalogues: po/LANGUAGE.po becomes share/locale/LANGUAGE/LC_MESSAGES/korvane-book.mo, in the build tree as in
# an installed one, where the program finds it beside itself.

find_program(KORVANE_MSGFMT msgfmt REQUIRED)
file(GLOB catalogues CONFIGURE_DEPENDS "${CMAKE_SOURCE_DIR}/po/*.po")
set(compiled "")
foreach(catalogue IN LISTS catalogues)
    cmake_path(GET catalogue STEM language)
    set(folder "${CMAKE_BINARY_DIR}/share/locale/${language}/LC_MESSAGES")
    add_custom_command(OUTPUT "${folder}/korvane-book.mo" DEPENDS "${catalogue}"
        COMMAND ${CMAKE_COMMAND} -E make_directory "${folder}"
        COMMAND ${KORVANE_MSGFMT} --check --output-file=${folder}/korvane-book.mo "${catalogue}")
    list(APPEND compiled "${folder}/korvane-book.mo")
    install(FILES "${folder}/korvane-book.mo" DESTINATION "${CMAKE_INSTALL_LOCALEDIR}/${language}/LC_MESSAGES")
endforeach()
add_custom_target(korvane_translations ALL DEPENDS ${compiled})
if(TARGET korvane)
    add_dependencies(korvane korvane_translations)
endif()
