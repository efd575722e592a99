# The manual pages, from their sources in man/.
find_program(SCDOC scdoc REQUIRED)
foreach(page tarnd.8 tarnctl.1 tarn-protocol.7)
    set(source ${CMAKE_CURRENT_SOURCE_DIR}/man/${page}.scd)
    add_custom_command(OUTPUT ${page} DEPENDS ${source} VERBATIM
        COMMAND sed s/@VERSION@/${PROJECT_VERSION}/ ${source} | ${SCDOC} > ${page})
    list(APPEND pages ${page})
    string(REGEX MATCH "[0-9]$" section ${page})
    install(FILES ${CMAKE_CURRENT_BINARY_DIR}/${page} DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section})
endforeach()
add_custom_target(tarn_manual ALL DEPENDS ${pages})
