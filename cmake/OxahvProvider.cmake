# A library that CIM servers load. An installed copy and this tree offer the same function.

# oxahv_add_provider(NAME [SOURCE…]) makes the target NAME, the module libNAME.so with the provider NAME. It exports the
# factories NAME_Create_… alone, which lets a server unload it: GCC makes data of inline functions unique in the process, and
# a library that exports such data stays mapped for good.
function(oxahv_add_provider name)
    add_library(${name} MODULE ${ARGN})
    target_link_libraries(${name} PRIVATE oxahv::providerutilities)
    set_target_properties(${name} PROPERTIES
        C_VISIBILITY_PRESET hidden
        CXX_VISIBILITY_PRESET hidden
        VISIBILITY_INLINES_HIDDEN ON)

    set(exports ${CMAKE_CURRENT_BINARY_DIR}/${name}.map)
    file(CONFIGURE OUTPUT ${exports} CONTENT "{ global: ${name}_Create_*; local: *; };\n")
    target_link_options(${name} PRIVATE -Wl,--version-script=${exports})
    set_property(TARGET ${name} APPEND PROPERTY LINK_DEPENDS ${exports})
    # Clang leaves a sanitizer's runtime to the program, so with one some symbols are undefined here.
    if(NOT "${CMAKE_CXX_FLAGS} ${CMAKE_MODULE_LINKER_FLAGS}" MATCHES "-fsanitize")
        set(sanitizers $<FILTER:$<TARGET_PROPERTY:${name},COMPILE_OPTIONS>,INCLUDE,^-fsanitize>)
        target_link_options(${name} PRIVATE $<$<STREQUAL:${sanitizers},>:-Wl,--no-undefined>)
    endif()

    # Servers want the library in a folder of their own, often by a copy: what is relative holds where that folder lies below
    # the libraries', the absolute folder everywhere. The system's own folders need neither.
    get_target_property(is_installed oxahv::providerutilities IMPORTED)
    if(is_installed)
        get_target_property(library oxahv::providerutilities LOCATION)
        cmake_path(GET library PARENT_PATH folder)
    else()
        include(GNUInstallDirs)
        set(folder ${CMAKE_INSTALL_FULL_LIBDIR})
    endif()
    if(NOT folder IN_LIST CMAKE_CXX_IMPLICIT_LINK_DIRECTORIES)
        set_target_properties(${name} PROPERTIES
            BUILD_RPATH "$ORIGIN/.."
            INSTALL_RPATH "$ORIGIN/..;${folder}")
    endif()
endfunction()

# oxahv_add_provider_check(TARGET MOF FILE… [CLASSES CLASS…] [ARGUMENTS ARGUMENT…]) adds the test TARGET.check: oxahv-provider
# checks the library TARGET, whose MI name is the target's, with the classes of the MOF files or some of them. The arguments are
# further ones of `check`, such as --strict.
function(oxahv_add_provider_check target)
    cmake_parse_arguments(PARSE_ARGV 1 check "" "" "MOF;CLASSES;ARGUMENTS")
    if(NOT check_MOF)
        message(FATAL_ERROR "oxahv_add_provider_check(${target}) needs MOF and the files that declare the provider's classes")
    endif()
    if(TARGET oxahvrunner)
        set(command $<TARGET_FILE:oxahvrunner>)
    else()
        find_program(OXAHV_PROVIDER_COMMAND oxahv-provider HINTS ${OXAHV_PROVIDER_COMMAND_FOLDER} REQUIRED
            DOC "Checks providers")
        set(command ${OXAHV_PROVIDER_COMMAND})
    endif()
    set(arguments "")
    foreach(file IN LISTS check_MOF)
        cmake_path(ABSOLUTE_PATH file BASE_DIRECTORY ${CMAKE_CURRENT_SOURCE_DIR})
        list(APPEND arguments --mof ${file})
    endforeach()
    list(APPEND arguments check)
    foreach(class IN LISTS check_CLASSES)
        list(APPEND arguments --class ${class})
    endforeach()
    add_test(NAME ${target}.check
        COMMAND ${command} --library $<TARGET_FILE:${target}> --provider ${target} ${arguments} ${check_ARGUMENTS})
endfunction()
