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

install(DIRECTORY DESTINATION quor/etc COMPONENT tools)

if(QUOR_BUILD_TOOLS)
    set(etc ${PROJECT_SOURCE_DIR}/etc)
    install(FILES ${etc}/notify.filter DESTINATION ${CMAKE_INSTALL_SYSCONFDIR}/quorsyslog COMPONENT tools)
    install(FILES ${etc}/syslog-ng/tls-on.conf DESTINATION ${CMAKE_INSTALL_DATADIR}/quorsyslog COMPONENT tools)
    install(FILES ${etc}/syslog-ng/quorsyslog.conf DESTINATION ${CMAKE_INSTALL_DATADIR}/quorsyslog
            RENAME syslog-ng.conf COMPONENT tools)
    install(PROGRAMS packaging/reserve-buffer packaging/limit-connections DESTINATION lib/quorsyslog COMPONENT tools)
    install(FILES packaging/values.sh DESTINATION lib/quorsyslog COMPONENT tools)
    install(PROGRAMS packaging/quorlog-tls DESTINATION ${CMAKE_INSTALL_SBINDIR} COMPONENT tools)
    install(PROGRAMS ${etc}/init.d/quorlogd DESTINATION ${CMAKE_INSTALL_SYSCONFDIR}/init.d COMPONENT tools)
    install(FILES ${etc}/sysctl.d/quorsyslog.conf DESTINATION lib/sysctl.d COMPONENT tools)
    install(FILES ${etc}/systemd/quorlogd.service ${etc}/systemd/quorsyslog-connections.service
            DESTINATION lib/systemd/system COMPONENT tools)
    install(FILES ${etc}/quorinfo.conf.example ${etc}/syslog-ng/forward.conf.example
            DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/quorsyslog/examples COMPONENT tools)
    install(FILES ${etc}/systemd/syslog-ng-quorsyslog.conf DESTINATION lib/systemd/system/syslog-ng.service.d
            RENAME quorsyslog.conf COMPONENT tools)
    quor_install_manuals(tools notify.conf.5 notify.filter.5 quorinfo.conf.5 rules.conf.5 quorlog-tls.8)
    file(GLOB pages ${PROJECT_SOURCE_DIR}/docs/*.md)
    install(FILES ${pages} DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/quorsyslog COMPONENT tools)
endif()
quor_install_manuals(development quorsyslog.3)

# A build with QUOR_ROOT finds the same data below that folder.
if(QUOR_ROOT)
    add_custom_target(root_data ALL
        COMMAND ${CMAKE_COMMAND} -E copy_directory ${PROJECT_SOURCE_DIR}/schema ${QUOR_ROOT}/usr/${QUOR_SCHEMA_FOLDER}
        COMMAND ${CMAKE_COMMAND} -E copy_directory ${PROJECT_SOURCE_DIR}/texts ${QUOR_ROOT}/usr/${QUOR_TEXTS_FOLDER})
endif()
