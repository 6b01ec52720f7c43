# Options of all our targets; link velk_compile_options PRIVATE, so that programs built on our libraries choose their
# own.
add_library(velk_compile_options INTERFACE)

target_compile_options(velk_compile_options INTERFACE
    -Wall -Wextra -Wpedantic -Wconversion -Wsign-conversion -Wshadow
    -Wold-style-cast -Wnon-virtual-dtor -Woverloaded-virtual -Wnull-dereference -Wformat=2
    $<$<BOOL:${VELK_WARNINGS_AS_ERRORS}>:-Werror>
    # Log calls contain their source file: keep its name relative to the tree on every build machine.
    -fmacro-prefix-map=${PROJECT_SOURCE_DIR}/=)

target_compile_definitions(velk_compile_options INTERFACE
    # By default, release builds drop file, line and function of log calls.
    QT_MESSAGELOGCONTEXT
    QT_NO_CAST_FROM_ASCII
    QT_NO_CAST_TO_ASCII
    QT_NO_CAST_FROM_BYTEARRAY
    QT_NO_KEYWORDS
    QT_NO_URL_CAST_FROM_STRING
    QT_NO_NARROWING_CONVERSIONS_IN_CONNECT
    QT_STRICT_ITERATORS
    QT_USE_QSTRINGBUILDER)
