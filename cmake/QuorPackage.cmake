# Debian packages of the library, the development files and the programs, and a tarball of everything (cpack -G TGZ).
set(CPACK_PACKAGE_VENDOR "The quorsyslog maintainers")
set(CPACK_PACKAGE_CONTACT "The quorsyslog maintainers <quorsyslog@example.org>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY ${PROJECT_DESCRIPTION})
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_SET_DESTDIR ON)
set(CPACK_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_SOURCE_DIR}/build/packages)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE
    WORLD_READ WORLD_EXECUTE)
set(architecture amd64)
if(CMAKE_SYSTEM_PROCESSOR STREQUAL "powerpc")
    set(architecture powerpc)
elseif(NOT CMAKE_SYSTEM_PROCESSOR STREQUAL "x86_64")
    set(architecture ${CMAKE_SYSTEM_PROCESSOR})
endif()
set(CPACK_PACKAGE_FILE_NAME quorsyslog-${PROJECT_VERSION}-${architecture})

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_ALL library development tools)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE ${architecture})
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_COMPONENT_LIBRARY_DESCRIPTION "Library that searches, counts and accounts logs
 The logs are those that syslog-ng stores in SQLite databases. The library
 keeps statistics of them, and sends notices of what a rule matches.")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "Headers of the log library
 And what else a program needs to be built with it.")
set(CPACK_COMPONENT_TOOLS_DESCRIPTION "Log server on syslog-ng and SQLite
 syslog-ng receives messages of devices and stores them in a database.
 quorlog searches and counts them on the command line; quorlogd accounts them
 by device, checks rules, and sends notices.")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_NAME libquorsyslog${PROJECT_VERSION_MAJOR})
set(CPACK_DEBIAN_LIBRARY_PACKAGE_SECTION libs)
set(common_libraries "libc6 (>= 2.36), libgcc-s1, libstdc++6 (>= 12), libsqlite3-0 (>= 3.40)")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_DEPENDS "${common_libraries}, libjsoncpp25 (>= 1.9.5), libxxhash0 (>= 0.8), libzstd1 (>= 1.5), sqlite3")
if(QUOR_WITH_CURL)
    string(APPEND CPACK_DEBIAN_LIBRARY_PACKAGE_DEPENDS ", libcurl4 (>= 7.88)")
endif()
set(same_library "libquorsyslog${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_CONTROL_EXTRA ${PROJECT_SOURCE_DIR}/packaging/triggers)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libquorsyslog-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "${same_library}")
set(CPACK_DEBIAN_TOOLS_PACKAGE_NAME quorsyslog)
set(CPACK_DEBIAN_TOOLS_PACKAGE_SECTION admin)
set(CPACK_DEBIAN_TOOLS_PACKAGE_DEPENDS "${same_library}, ${common_libraries}, libre2-9, libutf8proc2, syslog-ng-core (>= 3.38), \
syslog-ng-mod-sql, libdbd-sqlite3, openssl")
set(CPACK_DEBIAN_TOOLS_PACKAGE_RECOMMENDS "ca-certificates")
set(CPACK_DEBIAN_TOOLS_PACKAGE_SUGGESTS "nftables")
set(scripts ${PROJECT_SOURCE_DIR}/packaging)
set(CPACK_DEBIAN_TOOLS_PACKAGE_CONTROL_EXTRA ${scripts}/conffiles ${scripts}/postinst ${scripts}/prerm
    ${scripts}/postrm)

quor_compress(${PROJECT_SOURCE_DIR}/packaging/changelog ${PROJECT_BINARY_DIR}/changelog.gz)
foreach(pair library=libquorsyslog${PROJECT_VERSION_MAJOR} development=libquorsyslog-dev tools=quorsyslog)
    string(REPLACE "=" ";" pair ${pair})
    list(GET pair 0 component)
    list(GET pair 1 package)
    install(FILES packaging/copyright ${PROJECT_BINARY_DIR}/changelog.gz
            DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${package} COMPONENT ${component})
endforeach()
include(CPack)
