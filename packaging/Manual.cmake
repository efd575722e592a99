# The manual pages, from their sources in man/.
find_program(SCDOC scdoc REQUIRED)
set(parts_tarnd.8 service)
set(parts_tarnctl.1 tool)
set(parts_tarn-protocol.7 development)
foreach(page tarnd.8 tarnctl.1 tarn-protocol.7)
    set(source ${CMAKE_CURRENT_SOURCE_DIR}/man/${page}.scd)
    add_custom_command(OUTPUT ${page}.gz DEPENDS ${source} VERBATIM
        COMMAND sed s/@VERSION@/${PROJECT_VERSION}/ ${source} | ${SCDOC} | gzip -9n > ${page}.gz)
    list(APPEND pages ${page}.gz)
    string(REGEX MATCH "[0-9]$" section ${page})
    install(FILES ${CMAKE_CURRENT_BINARY_DIR}/${page}.gz DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section}
        COMPONENT ${parts_${page}})
endforeach()
add_custom_target(tarn_manual ALL DEPENDS ${pages})
