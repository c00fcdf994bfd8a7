# What is installed besides the libraries: the exported package, pkg-config, and the data of the system.
include(CMakePackageConfigHelpers)

set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/quorsyslog)
install(EXPORT quorsyslog NAMESPACE quorsyslog:: FILE quorsyslogTargets.cmake
        DESTINATION ${package_folder} COMPONENT development)
configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/quorsyslogConfig.cmake.in
        ${PROJECT_BINARY_DIR}/quorsyslogConfig.cmake INSTALL_DESTINATION ${package_folder})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/quorsyslogConfigVersion.cmake
        COMPATIBILITY SameMajorVersion)
install(FILES ${PROJECT_BINARY_DIR}/quorsyslogConfig.cmake ${PROJECT_BINARY_DIR}/quorsyslogConfigVersion.cmake
        DESTINATION ${package_folder} COMPONENT development)

configure_file(${CMAKE_CURRENT_LIST_DIR}/quorsyslog.pc.in ${PROJECT_BINARY_DIR}/quorsyslog.pc @ONLY)
install(FILES ${PROJECT_BINARY_DIR}/quorsyslog.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig
        COMPONENT development)

# Below the prefix /usr these are the fixed paths.
set(QUOR_SCHEMA_FOLDER quor/syslog/schema)
set(QUOR_TEXTS_FOLDER quor/quorman/webman/modules/Orvane/texts)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/schema/ DESTINATION ${QUOR_SCHEMA_FOLDER} COMPONENT tools)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/texts/ DESTINATION ${QUOR_TEXTS_FOLDER} COMPONENT tools)

# A build with QUOR_ROOT finds the same data below that folder.
if(QUOR_ROOT)
    add_custom_target(root_data ALL
        COMMAND ${CMAKE_COMMAND} -E copy_directory ${PROJECT_SOURCE_DIR}/schema ${QUOR_ROOT}/usr/${QUOR_SCHEMA_FOLDER}
        COMMAND ${CMAKE_COMMAND} -E copy_directory ${PROJECT_SOURCE_DIR}/texts ${QUOR_ROOT}/usr/${QUOR_TEXTS_FOLDER})
endif()
