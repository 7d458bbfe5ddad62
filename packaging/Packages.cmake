# Debian packages (cpack -G DEB, see script/package) and the source archive (cpack --config CPackSourceConfig.cmake).
#
# CPack stages the components and splits off the debug symbols; Dependencies.cmake tells dpkg-shlibdeps of the libraries in this
# tree, and finish brings each package to the form that Debian gives its own.

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME ${PROJECT_NAME})
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "") # each package has its own
set(CPACK_PACKAGE_CONTACT "The maintainers of oxahvproviderutilities <maintainers@oxahvproviderutilities.invalid>"
    CACHE STRING "Whom packages name as their maintainer")
set(CPACK_VERBATIM_VARIABLES ON)
set(CPACK_STRIP_FILES OFF) # finds nothing to strip once the debug symbols are split off

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING ONE_PER_GROUP)
set(CPACK_DEBIAN_PACKAGE_SOURCE ${PROJECT_NAME})
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_DEBUGINFO_PACKAGE ON)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_COMPRESSION_TYPE xz)
set(CPACK_PRE_BUILD_SCRIPTS ${PROJECT_SOURCE_DIR}/packaging/Dependencies.cmake)
set(CPACK_POST_BUILD_SCRIPTS ${PROJECT_SOURCE_DIR}/packaging/Finish.cmake)

set(oxahv_revision "${PROJECT_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE}")
set(oxahv_control ${PROJECT_BINARY_DIR}/packaging)
set(CPACK_OXAHV_SHLIBS ${oxahv_control}/shlibs)
file(REMOVE ${CPACK_OXAHV_SHLIBS})

# oxahv_package(COMPONENT NAME SECTION SUMMARY DESCRIPTION [BINARIES] [DEPENDS …] [RECOMMENDS …] [ARCHITECTURE all]).
# What BINARIES need is found by dpkg-shlibdeps.
macro(oxahv_package component name section summary description)
    cmake_parse_arguments(package "BINARIES" "ARCHITECTURE" "DEPENDS;RECOMMENDS" ${ARGN})
    list(APPEND CPACK_COMPONENTS_ALL ${component})
    string(TOUPPER ${component} upper)
    set(CPACK_DEBIAN_${upper}_PACKAGE_NAME ${name})
    set(CPACK_DEBIAN_${upper}_PACKAGE_SECTION ${section})
    set(CPACK_DEBIAN_${upper}_DESCRIPTION "${summary}\n${description}")
    string(REPLACE ";" ", " CPACK_DEBIAN_${upper}_PACKAGE_DEPENDS "${package_DEPENDS}")
    string(REPLACE ";" ", " CPACK_DEBIAN_${upper}_PACKAGE_RECOMMENDS "${package_RECOMMENDS}")
    set(CPACK_DEBIAN_${upper}_PACKAGE_ARCHITECTURE "${package_ARCHITECTURE}")
    set(CPACK_DEBIAN_${upper}_PACKAGE_SHLIBDEPS ${package_BINARIES})
endmacro()

# The package of a shared library, which tells what depends on it: oxahv_library_package(COMPONENT LIBRARY SUMMARY DESCRIPTION).
# Any build of this version or a later one satisfies it, and so does an agent's package that provides it.
macro(oxahv_library_package component library summary description)
    set(name ${library}${PROJECT_VERSION_MAJOR})
    oxahv_package(${component} ${name} libs "${summary}" "${description}" BINARIES)
    set(shlibs "${library} ${PROJECT_VERSION_MAJOR} ${name} (>= ${PROJECT_VERSION})\n")
    file(WRITE ${oxahv_control}/${name}/shlibs "${shlibs}")
    file(APPEND ${CPACK_OXAHV_SHLIBS} "${shlibs}")
    file(WRITE ${oxahv_control}/${name}/triggers "activate-noawait ldconfig\n")
    set(CPACK_DEBIAN_${upper}_PACKAGE_CONTROL_EXTRA ${oxahv_control}/${name}/shlibs ${oxahv_control}/${name}/triggers)
endmacro()

# Where dpkg-shlibdeps finds them.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS)
foreach(target oxahvcommon oxahvlocale oxahvlogger oxahvproviderutilities oxahvbroker)
    get_target_property(folder ${target} BINARY_DIR)
    list(APPEND CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${folder})
endforeach()

oxahv_library_package(runtime liboxahvproviderutilities
    "utilities for CIM providers written against CMPI"
"CIM servers load providers: shared libraries that serve the instances,
associations and methods of management classes. This library names managed
objects by typed keys and converts them to and from CMPI object paths, sets
and reads properties, keys and arguments, and traces all of it in one way.
.
It is loaded by the providers that were built with it.")

set(oxahv_stand_in
"
.
It stands in for the library of that name that comes with a management agent.
Where an agent brings its own, the agent's package provides, conflicts with
and replaces this one.")
oxahv_library_package(common liboxahvcommon
    "dates, texts and property files for CIM providers"
"This library holds the types for dates, locks and property files, and the
conversion of texts, that liboxahvproviderutilities1 takes and returns.${oxahv_stand_in}")
oxahv_library_package(locale liboxahvlocale
    "localised texts for CIM providers"
"This library looks up the texts that CIM providers show, by the locale of the
process, with the catalogues that it is installed with.${oxahv_stand_in}")
oxahv_library_package(logger liboxahvlogger
    "logger and traces for CIM providers"
"This library takes the log and trace messages of CIM providers and writes them
to the sink that the process sets.${oxahv_stand_in}")
oxahv_library_package(broker liboxahvbroker
    "CMPI broker inside one process"
"This library is a CMPI broker that runs inside a test or a command: it loads
CIM providers, sends them requests, and keeps account of what they do.
.
It is loaded by the programs that were built with it.")

oxahv_package(development liboxahvproviderutilities-dev libdevel
    "utilities for CIM providers written against CMPI - development files"
"This package holds what CIM providers are built with: the headers of
liboxahvproviderutilities1 and of the libraries that it stands on, the CMPI
headers, the CMake package and the pkg-config file."
    DEPENDS
        "liboxahvproviderutilities${PROJECT_VERSION_MAJOR} (= ${oxahv_revision})"
        "liboxahvcommon${PROJECT_VERSION_MAJOR} (>= ${PROJECT_VERSION})"
        "liboxahvlocale${PROJECT_VERSION_MAJOR} (>= ${PROJECT_VERSION})"
        "liboxahvlogger${PROJECT_VERSION_MAJOR} (>= ${PROJECT_VERSION})"
    RECOMMENDS liboxahvbroker-dev oxahv-provider)
oxahv_package(broker_development liboxahvbroker-dev libdevel
    "CMPI broker inside one process - development files"
"This package holds what the tests of CIM providers are built with: the broker's
header, its part of the CMake package, and its pkg-config file."
    DEPENDS
        "liboxahvbroker${PROJECT_VERSION_MAJOR} (= ${oxahv_revision})"
        "liboxahvproviderutilities-dev (= ${oxahv_revision})")
if(TARGET oxahvrunner)
    oxahv_package(runner oxahv-provider devel
        "command that loads a CIM provider and sends it requests"
"oxahv-provider loads a CMPI provider into a broker of its own and sends it
the requests of a CIM client: names, instances, associations and methods.
It shows the replies as MOF or JSON, traces, and injects faults. No CIM
server is needed."
        BINARIES)
endif()
if(TARGET OXAHostProvider)
    oxahv_package(example oxahv-host-provider admin
        "CIM provider for this machine - example"
"This provider serves the computer system, its operating system and its network
ports. It is an example of a provider written with liboxahvproviderutilities1;
its source is in liboxahvproviderutilities-doc."
        BINARIES
        RECOMMENDS oxahv-provider)
endif()
oxahv_package(documentation liboxahvproviderutilities-doc doc
    "utilities for CIM providers written against CMPI - documentation"
"This package holds the documentation of liboxahvproviderutilities1 and the
source of the example provider, which is meant to be copied."
    ARCHITECTURE all)

# The archive of the tree.
set(CPACK_SOURCE_GENERATOR TGZ)
set(CPACK_SOURCE_PACKAGE_FILE_NAME ${PROJECT_NAME}-${PROJECT_VERSION})
set(CPACK_SOURCE_IGNORE_FILES "^${PROJECT_SOURCE_DIR}/\\.git(/|$)" "^${PROJECT_SOURCE_DIR}/build/" "^${PROJECT_BINARY_DIR}/")

include(CPack)
