# How our own code is compiled. The target quor_build is never exported.
add_library(quor_build INTERFACE)
target_compile_features(quor_build INTERFACE cxx_std_17)
target_compile_options(quor_build INTERFACE
    -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Werror)
target_compile_definitions(quor_build INTERFACE _FILE_OFFSET_BITS=64)
# A header, not a definition: another root compiles anew only what knows a fixed path.
file(CONFIGURE OUTPUT ${PROJECT_BINARY_DIR}/generated/quor_root.h CONTENT "#define QUOR_ROOT \"@QUOR_ROOT@\"\n" @ONLY)
target_include_directories(quor_build INTERFACE ${PROJECT_SOURCE_DIR} ${PROJECT_BINARY_DIR}/generated)
target_link_options(quor_build INTERFACE -Wl,--as-needed)

set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

if(QUOR_SANITIZE)
    add_compile_options(-fsanitize=${QUOR_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${QUOR_SANITIZE})
endif()

find_program(CCACHE ccache)
if(CCACHE)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${CCACHE})
endif()

# A library with its headers, in the exported package.
function(quor_install_library target header_folder headers)
    set_target_properties(${target} PROPERTIES VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR})
    target_include_directories(${target} INTERFACE $<INSTALL_INTERFACE:include>)
    if(BUILD_SHARED_LIBS)
        set(map ${PROJECT_SOURCE_DIR}/cmake/${target}.map)
        target_link_options(${target} PRIVATE LINKER:--version-script=${map},--no-undefined-version)
        set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS ${map})
    endif()
    install(TARGETS ${target} EXPORT quorsyslog
            RUNTIME COMPONENT tools LIBRARY COMPONENT library NAMELINK_COMPONENT development
            ARCHIVE COMPONENT development)
    install(DIRECTORY ${headers} DESTINATION ${header_folder} COMPONENT development FILES_MATCHING PATTERN "*.h")
endfunction()

# The same bytes on every machine and at any time.
function(quor_compress from to)
    execute_process(COMMAND gzip -9n INPUT_FILE ${from} OUTPUT_FILE ${to} COMMAND_ERROR_IS_FATAL ANY)
endfunction()

# Manual pages of docs/man, each in the section that its name ends with.
function(quor_install_manuals component)
    foreach(page ${ARGN})
        string(REGEX MATCH "[0-9]$" section ${page})
        quor_compress(${PROJECT_SOURCE_DIR}/docs/man/${page} ${PROJECT_BINARY_DIR}/${page}.gz)
        install(FILES ${PROJECT_BINARY_DIR}/${page}.gz DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section}
                COMPONENT ${component})
    endforeach()
endfunction()

# What a test writes before the path of one of our programs, in a shell's words: the emulator of a cross build.
list(JOIN CMAKE_CROSSCOMPILING_EMULATOR " " QUOR_EMULATOR)

# quor_add_test(NAME SOURCES... [LIBS libraries...] [ROOT]): one GoogleTest executable. ROOT marks tests that use the
# fixed paths below QUOR_ROOT, so that they do not run at the same time.
set(CMAKE_LINK_DEPENDS_NO_SHARED ON)  # a program stays as it is when only the inside of a library has changed

function(quor_add_test name)
    cmake_parse_arguments(TEST "ROOT" "" "LIBS" ${ARGN})
    add_executable(${name} ${TEST_UNPARSED_ARGUMENTS})
    target_link_libraries(${name} PRIVATE quor_build ${TEST_LIBS} quorsyslog::quorsyslog SQLite::SQLite3
                          GTest::gtest_main)
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests)
    set(lock "")
    if(TEST_ROOT)
        set(lock RESOURCE_LOCK root)
    endif()
    gtest_discover_tests(${name} TEST_PREFIX ${name}. DISCOVERY_MODE PRE_TEST PROPERTIES TIMEOUT 300 ${lock})
endfunction()
