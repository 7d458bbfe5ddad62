# What an installed copy holds: the libraries and their headers, a CMake package and pkg-config files.

# Components: runtime is the library; common, locale and logger are the stand-ins, each by itself, since an agent's own
# library takes its place; broker the embedded broker; development and broker_development what is built with; runner,
# example and documentation.

# Installs a shared library, and what links against it finds it by: oxahv_install_library(TARGET COMPONENT DEVELOPMENT EXPORT).
function(oxahv_install_library target component development export)
    install(TARGETS ${target} EXPORT ${export}
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT ${component} NAMELINK_COMPONENT ${development})
endfunction()
install(TARGETS oxahvexport oxahvcmpi oxahvlibrarycmpi oxahvproviderkit EXPORT oxahvproviderutilities-targets)
foreach(name common locale logger)
    oxahv_install_library(oxahv${name} ${name} development oxahvproviderutilities-targets)
endforeach()
oxahv_install_library(oxahvproviderutilities runtime development oxahvproviderutilities-targets)
oxahv_install_library(oxahvbroker broker broker_development oxahvbroker-targets)

set(oxahv_include ${CMAKE_INSTALL_INCLUDEDIR}/oxahv)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/include/ ${PROJECT_SOURCE_DIR}/export/ ${PROJECT_BINARY_DIR}/export/include/
    DESTINATION ${oxahv_include} COMPONENT development FILES_MATCHING PATTERN "*.h")
install(DIRECTORY ${PROJECT_SOURCE_DIR}/kit/
    DESTINATION ${oxahv_include}/kit COMPONENT development FILES_MATCHING PATTERN "*.h")
install(DIRECTORY
    ${PROJECT_SOURCE_DIR}/platform/common/
    ${PROJECT_SOURCE_DIR}/platform/locale/
    ${PROJECT_SOURCE_DIR}/platform/logger/
    DESTINATION ${oxahv_include}/platform COMPONENT development
    FILES_MATCHING PATTERN "*.h" PATTERN private EXCLUDE PATTERN po EXCLUDE)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/cmpi/
    DESTINATION ${oxahv_include}/cmpi COMPONENT development FILES_MATCHING PATTERN "*.h")
install(DIRECTORY ${PROJECT_SOURCE_DIR}/broker/include/
    DESTINATION ${oxahv_include}/broker COMPONENT broker_development)

set(oxahv_package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/oxahvproviderutilities)
install(EXPORT oxahvproviderutilities-targets
    NAMESPACE oxahv:: DESTINATION ${oxahv_package_dir} COMPONENT development)
install(EXPORT oxahvbroker-targets
    NAMESPACE oxahv:: DESTINATION ${oxahv_package_dir} COMPONENT broker_development)
configure_package_config_file(
    ${PROJECT_SOURCE_DIR}/cmake/oxahvproviderutilities-config.cmake.in
    ${PROJECT_BINARY_DIR}/oxahvproviderutilities-config.cmake
    INSTALL_DESTINATION ${oxahv_package_dir}
    PATH_VARS CMAKE_INSTALL_BINDIR
    NO_SET_AND_CHECK_MACRO)
write_basic_package_version_file(
    ${PROJECT_BINARY_DIR}/oxahvproviderutilities-config-version.cmake COMPATIBILITY SameMajorVersion)
install(FILES
    ${PROJECT_BINARY_DIR}/oxahvproviderutilities-config.cmake
    ${PROJECT_BINARY_DIR}/oxahvproviderutilities-config-version.cmake
    ${PROJECT_SOURCE_DIR}/cmake/OxahvProvider.cmake
    DESTINATION ${oxahv_package_dir} COMPONENT development)

# The prefix is found from where the .pc file lies, so that an installed copy can be moved.
file(RELATIVE_PATH oxahv_pc_prefix
    ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" oxahv_pc_prefix "${oxahv_pc_prefix}")
if(CMPI_INCLUDE_DIR)
    set(oxahv_pc_cmpi "${CMPI_INCLUDE_DIR}")
else()
    set(oxahv_pc_cmpi "\${includedir}/oxahv/cmpi")
endif()
foreach(name oxahvproviderutilities oxahvproviderkit oxahvbroker)
    configure_file(${PROJECT_SOURCE_DIR}/cmake/${name}.pc.in ${PROJECT_BINARY_DIR}/${name}.pc @ONLY)
endforeach()
install(FILES ${PROJECT_BINARY_DIR}/oxahvproviderutilities.pc ${PROJECT_BINARY_DIR}/oxahvproviderkit.pc
    DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT development)
install(FILES ${PROJECT_BINARY_DIR}/oxahvbroker.pc
    DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT broker_development)

# The example is documentation too: a provider to start from.
install(FILES ${PROJECT_SOURCE_DIR}/README.md ${PROJECT_SOURCE_DIR}/CHANGELOG.md
    DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT documentation)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/examples
    DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT documentation)
