# What every target of this project is built with.

set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_C_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)

if(PROJECT_IS_TOP_LEVEL AND NOT CMAKE_BUILD_TYPE AND NOT CMAKE_CONFIGURATION_TYPES)
    set(CMAKE_BUILD_TYPE RelWithDebInfo CACHE STRING "Kind of build" FORCE)
endif()

# Installs one part, where anything is installed at all.
macro(oxahv_install)
    if(OXAHV_INSTALL)
        install(${ARGN})
    endif()
endmacro()

# An installed copy finds its libraries from where it lies, so that it can be moved; in the system's own folder the dynamic
# linker finds them. Paths in the build tree are relative too: a file does not depend on where it was built.
include(GNUInstallDirs)
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)
set(oxahv_system_folders ${CMAKE_C_IMPLICIT_LINK_DIRECTORIES} ${CMAKE_CXX_IMPLICIT_LINK_DIRECTORIES})
# The run path of what is installed into `folder`, for its target's property INSTALL_RPATH.
function(oxahv_run_path variable folder)
    set(${variable} "" PARENT_SCOPE)
    if(NOT CMAKE_INSTALL_FULL_LIBDIR IN_LIST oxahv_system_folders)
        file(RELATIVE_PATH way ${folder} ${CMAKE_INSTALL_FULL_LIBDIR})
        string(REGEX REPLACE "/$" "" way "$ORIGIN/${way}")
        set(${variable} "${way}" PARENT_SCOPE)
    endif()
endfunction()
oxahv_run_path(CMAKE_INSTALL_RPATH ${CMAKE_INSTALL_FULL_LIBDIR})

set(OXAHV_SANITIZE "" CACHE STRING "Sanitizers to build with, for example address,undefined")

set(oxahv_warnings -Wall -Wextra -Wpedantic -Wconversion -Wshadow)
set(oxahv_hardening
    -fstack-protector-strong
    -fstack-clash-protection
    $<$<IN_LIST:${CMAKE_SYSTEM_PROCESSOR},x86_64;i686>:-fcf-protection>)
# Fortified libc calls need the optimizer, and sanitizers bring checks of their own. A distribution that sets a level in its
# flags keeps it; some compilers have one built in.
if(NOT OXAHV_SANITIZE AND NOT "${CMAKE_C_FLAGS} ${CMAKE_CXX_FLAGS}" MATCHES "_FORTIFY_SOURCE=")
    list(APPEND oxahv_hardening $<$<NOT:$<CONFIG:Debug>>:-U_FORTIFY_SOURCE> $<$<NOT:$<CONFIG:Debug>>:-D_FORTIFY_SOURCE=2>)
endif()

# Warnings, hidden symbols, hardening and sanitizers for one target.
function(oxahv_target_defaults target)
    set_target_properties(${target} PROPERTIES
        C_VISIBILITY_PRESET hidden
        CXX_VISIBILITY_PRESET hidden
        VISIBILITY_INLINES_HIDDEN ON)
    target_compile_options(${target} PRIVATE
        ${oxahv_warnings}
        ${oxahv_hardening}
        # Source names in traces, assertions and debug information do not depend on where tree and build lie. Debuggers
        # find the sources when they are started in the tree.
        -ffile-prefix-map=${PROJECT_SOURCE_DIR}/=
        -ffile-prefix-map=${CMAKE_BINARY_DIR}=.)
    target_link_options(${target} PRIVATE -Wl,-z,relro,-z,now,-z,noexecstack)
    if(OXAHV_SANITIZE)
        target_compile_options(${target} PRIVATE -fsanitize=${OXAHV_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
        target_link_options(${target} PRIVATE -fsanitize=${OXAHV_SANITIZE})
    else()
        # Sanitizer runtimes are found at run time, so only a plain build can insist on this.
        target_link_options(${target} PRIVATE -Wl,--no-undefined)
    endif()
endfunction()

# An installed shared library `name` with the alias `oxahv::alias`; sources follow.
function(oxahv_add_shared_library name alias)
    add_library(${name} SHARED ${ARGN})
    add_library(oxahv::${alias} ALIAS ${name})
    set_target_properties(${name} PROPERTIES
        EXPORT_NAME ${alias}
        VERSION ${PROJECT_VERSION}
        SOVERSION ${PROJECT_VERSION_MAJOR})
    target_compile_features(${name} PUBLIC cxx_std_17)
    oxahv_target_defaults(${name})
    set(exports ${PROJECT_SOURCE_DIR}/export/exports.map)
    target_link_options(${name} PRIVATE -Wl,--version-script=${exports})
    set_property(TARGET ${name} APPEND PROPERTY LINK_DEPENDS ${exports})
endfunction()
