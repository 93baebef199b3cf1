# SPDX-License-Identifier: Apache-2.0
# Settings that every target of the project shares.

set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

option(ZENT_WARNINGS_AS_ERRORS "Treat compiler warnings as errors" OFF)
set(ZENT_SANITIZE "" CACHE STRING "Sanitizers to build with, as the compiler names them: address,undefined or thread")
option(ZENT_FUZZ "Build the fuzzers (clang), with both sanitizers" OFF)
option(ZENT_HARDEN "Build with hardening flags (PIE, full RELRO, stack protector, _FORTIFY_SOURCE)" OFF)

include(CheckPIESupported)
check_pie_supported()

add_compile_options(-Wall -Wextra -Wpedantic)
# Where the tree lies on the machine that builds it is nobody's business.
add_compile_options(-ffile-prefix-map=${CMAKE_SOURCE_DIR}/=)
# Release builds would otherwise lose file, line and function from every log line.
add_compile_definitions(QT_MESSAGELOGCONTEXT QT_NO_CAST_TO_ASCII QT_NO_URL_CAST_FROM_STRING)

if(ZENT_WARNINGS_AS_ERRORS)
    add_compile_options(-Werror)
endif()
if(ZENT_SANITIZE)
    add_compile_options(-fsanitize=${ZENT_SANITIZE} -fno-sanitize-recover=undefined -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${ZENT_SANITIZE})
endif()
if(ZENT_FUZZ)
    add_compile_options(-fsanitize=fuzzer-no-link,address,undefined -fno-sanitize-recover=undefined
        -fno-omit-frame-pointer)
    add_link_options(-fsanitize=address,undefined)
endif()
if(ZENT_HARDEN)
    add_compile_options(-fstack-protector-strong -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2)
    add_link_options(-Wl,-z,relro -Wl,-z,now)
endif()

# zent_library(NAME SOURCES... ) declares a static library whose include directory is its own folder.
function(zent_library name)
    add_library(${name} STATIC ${ARGN})
    target_include_directories(${name} PUBLIC "$<BUILD_INTERFACE:${CMAKE_CURRENT_SOURCE_DIR}>")
endfunction()
