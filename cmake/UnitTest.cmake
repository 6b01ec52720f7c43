find_package(Qt5 5.15 REQUIRED COMPONENTS Test)

# velk_add_unit_test(<name> [USER domain|local] [LIBRARIES ...])
#
# Builds <name>.cpp, one QtTest executable, and runs it inside the simulated terminal: its own file view,
# its own empty system and session bus, as the wanted user.
function(velk_add_unit_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "USER" "LIBRARIES")
    if(NOT arg_USER)
        set(arg_USER domain)
    endif()

    add_executable(${name} ${name}.cpp)
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} velk_test_support Qt5::Test velk_compile_options)
    target_compile_definitions(${name} PRIVATE VELK_SOURCE_DIR="${PROJECT_SOURCE_DIR}")
    add_test(NAME ${name}
        COMMAND "${PROJECT_SOURCE_DIR}/sandbox/in-box" --user ${arg_USER} -- $<TARGET_FILE:${name}>)
    set_tests_properties(${name} PROPERTIES TIMEOUT 240)
endfunction()
