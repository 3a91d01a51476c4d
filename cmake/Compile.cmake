# How all of our own code is compiled: standard, warnings, sanitizers, cache.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF) # in GNU mode `linux` is a macro
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/bin)
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/bin)

set(CLIPSA_SANITIZE "" CACHE STRING "Sanitizers to build with: empty, `address,undefined` or `thread`")

find_package(Threads REQUIRED)
find_program(CCACHE_PROGRAM ccache)
if(CCACHE_PROGRAM)
    # Paths below the checkout count as relative ones, so that what one build folder compiled serves all of them.
    set(CMAKE_CXX_COMPILER_LAUNCHER ${CMAKE_COMMAND} -E env CCACHE_BASEDIR=${CMAKE_SOURCE_DIR} CCACHE_NOHASHDIR=1
                                    ${CCACHE_PROGRAM})
endif()

add_library(clipsa-compile INTERFACE)
target_compile_features(clipsa-compile INTERFACE cxx_std_20)
target_compile_options(clipsa-compile INTERFACE -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Werror)
target_compile_definitions(clipsa-compile INTERFACE QT_NO_KEYWORDS)

# Movies come from strangers: what overflows ends the program, and does not become theirs. tests/binaries looks for these
# in what was linked.
include(CheckPIESupported)
check_pie_supported()
target_compile_definitions(clipsa-compile INTERFACE _GLIBCXX_ASSERTIONS)
target_compile_options(clipsa-compile INTERFACE -fstack-protector-strong -fstack-clash-protection)
if(CMAKE_SYSTEM_PROCESSOR MATCHES "x86_64|AMD64|i.86")
    target_compile_options(clipsa-compile INTERFACE -fcf-protection)
elseif(CMAKE_SYSTEM_PROCESSOR MATCHES "aarch64|arm64")
    target_compile_options(clipsa-compile INTERFACE -mbranch-protection=standard) # the same there
endif()
if(NOT CLIPSA_SANITIZE) # a sanitizer has to see the plain calls
    target_compile_options(clipsa-compile INTERFACE -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=3)
endif()
target_link_options(clipsa-compile INTERFACE -Wl,-z,relro,-z,now)

if(CLIPSA_SANITIZE)
    target_compile_options(clipsa-compile INTERFACE -fsanitize=${CLIPSA_SANITIZE} -fno-omit-frame-pointer
                                                    -fno-sanitize-recover=all)
    target_link_options(clipsa-compile INTERFACE -fsanitize=${CLIPSA_SANITIZE})
endif()
