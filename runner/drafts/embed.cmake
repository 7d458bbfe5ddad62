# Makes a C++ source of the templates: cmake -DOUTPUT=FILE -P embed.cmake TEMPLATE…. A template is named by its file without .in.
set(cases "")
foreach(index RANGE 4 ${CMAKE_ARGC})
    set(file "${CMAKE_ARGV${index}}")
    if(file STREQUAL "")
        continue()
    endif()
    file(READ "${file}" text)
    cmake_path(GET file FILENAME name)
    string(REGEX REPLACE "\\.in$" "" name "${name}")
    string(APPEND cases "    if (name == \"${name}\") {\n        return R\"template(${text})template\";\n    }\n")
endforeach()
file(WRITE "${OUTPUT}" "#include \"drafts/Template.h\"

#include <stdexcept>
#include <string>

namespace oxahv::runner {

std::string_view templateText(std::string_view name) {
${cases}    throw std::logic_error(\"no template \" + std::string(name));
}

} // namespace oxahv::runner
")
