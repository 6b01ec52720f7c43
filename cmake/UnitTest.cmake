find_package(Qt5 5.15 REQUIRED COMPONENTS Test)

# velk_add_unit_test(<name> [USER domain|local] [MANUAL_CLOCK] [OWN_NETWORK] [LIBRARIES ...])
#
# Builds <name>.cpp, a QtTest executable, and runs it inside the simulated terminal as the given user, with its own file
# system view and its own empty system and session bus. MANUAL_CLOCK preloads a clock that the test moves (see
# support/manual_clock.h). OWN_NETWORK gives the test a network that it may change.
function(velk_add_unit_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "MANUAL_CLOCK;OWN_NETWORK" "USER" "LIBRARIES")
    if(NOT arg_USER)
        set(arg_USER domain)
    endif()

    add_executable(${name} ${name}.cpp)
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} velk_test_support Qt5::Test velk_compile_options)
    target_compile_definitions(${name} PRIVATE VELK_SOURCE_DIR="${PROJECT_SOURCE_DIR}")
    set(wrapper)
    if(arg_OWN_NETWORK)
        set(wrapper unshare --map-root-user --net)
    endif()
    if(arg_MANUAL_CLOCK)
        find_library(VELK_FAKETIME libfaketimeMT.so.1 PATH_SUFFIXES faketime REQUIRED)
        set(preload "${VELK_FAKETIME}")
        if(CMAKE_CXX_FLAGS MATCHES "-fsanitize=address")
            # AddressSanitizer must come before any other preloaded library.
            execute_process(COMMAND "${CMAKE_CXX_COMPILER}" -print-file-name=libasan.so
                OUTPUT_VARIABLE asan OUTPUT_STRIP_TRAILING_WHITESPACE COMMAND_ERROR_IS_FATAL ANY)
            file(REAL_PATH "${asan}" asan)
            string(PREPEND preload "${asan} ")
        endif()
        # QtTest's own time limit would include the time by which the clock is moved.
        set(wrapper env "LD_PRELOAD=${preload}" FAKETIME_TIMESTAMP_FILE=/tmp/clock FAKETIME_NO_CACHE=1
            QTEST_FUNCTION_TIMEOUT=86400000)
    endif()
    add_test(NAME ${name}
        COMMAND "${PROJECT_SOURCE_DIR}/sandbox/in-box" --user ${arg_USER} -- ${wrapper} $<TARGET_FILE:${name}>)
    set_tests_properties(${name} PROPERTIES TIMEOUT 240)
endfunction()
