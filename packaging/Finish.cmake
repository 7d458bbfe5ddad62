# The last word on the packages that CPack made.
if(CPACK_GENERATOR STREQUAL "DEB")
    execute_process(COMMAND ${CMAKE_CURRENT_LIST_DIR}/../tools/finish-packages ${CPACK_PACKAGE_FILES} COMMAND_ERROR_IS_FATAL ANY)
endif()
