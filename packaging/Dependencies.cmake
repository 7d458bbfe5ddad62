# Tells dpkg-shlibdeps in which packages the libraries of this tree are. CPack runs it in the folder of each component that holds
# binaries, and removes what lies in that folder's debian/ afterwards.
if(NOT CPACK_GENERATOR STREQUAL "DEB")
    return()
endif()
foreach(component IN LISTS CPACK_COMPONENTS_ALL)
    string(TOUPPER ${component} upper)
    if(CPACK_DEBIAN_${upper}_PACKAGE_SHLIBDEPS)
        set(folder ${CPACK_TEMPORARY_DIRECTORY}/${component}/debian)
        file(MAKE_DIRECTORY ${folder})
        file(COPY_FILE ${CPACK_OXAHV_SHLIBS} ${folder}/shlibs.local)
    endif()
endforeach()
