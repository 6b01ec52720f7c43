# velk_add_introspection(<target> <name> <xml>)
#
# Generates <name>_introspection.h from a D-Bus interface's XML file and adds its folder to the target's include
# directories. The header holds <NAME>_INTERFACE_NAME and <NAME>_INTROSPECTION, the text of the interface element:
# both as macros, because moc takes only literals into a class's information.
function(velk_add_introspection target name xml)
    set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS "${xml}")
    file(READ "${xml}" document)
    string(REGEX MATCH " *<interface name=\"([^\"]+)\".*</interface>\n" element "${document}")
    if(NOT element)
        message(FATAL_ERROR "${xml} holds no interface")
    endif()
    set(interface "${CMAKE_MATCH_1}")
    string(REPLACE "\"" "\\\"" text "${element}")
    string(REGEX REPLACE "([^\n]*)\n" " \\\\\n    \"\\1\\\\n\"" text "${text}")
    string(TOUPPER "${name}" NAME)
    set(folder "${CMAKE_CURRENT_BINARY_DIR}/introspection")
    file(CONFIGURE OUTPUT "${folder}/${name}_introspection.h" @ONLY CONTENT
"#pragma once
// Made from the interface's XML file by the build.

#define @NAME@_INTERFACE_NAME \"@interface@\"

#define @NAME@_INTROSPECTION@text@
")
    target_include_directories(${target} PUBLIC "${folder}")
endfunction()
