# What every target of the project is compiled with, and the one function that makes a layer.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

# Thumbnails are exact to the bit, so a product and a sum are never contracted into one rounding. Nothing looks
# at floating-point exceptions, and without them more loops become vectors; results stay the same.
add_library(qel_options INTERFACE)
target_compile_options(qel_options INTERFACE
  -Wall -Wextra -Wpedantic -Werror -Wshadow -Wconversion -Wsign-conversion -Wswitch
  -Woverloaded-virtual -Wcast-qual -Wformat=2
  -ffp-contract=off -fno-trapping-math)
target_compile_definitions(qel_options INTERFACE _GLIBCXX_ASSERTIONS)

if(WIN32)
  target_compile_definitions(qel_options INTERFACE
    UNICODE _UNICODE NOMINMAX WIN32_LEAN_AND_MEAN STRICT WINVER=0x0601 _WIN32_WINNT=0x0601 NTDDI_VERSION=0x06010000)
  # A release is byte-identical wherever it is built: no folder names, no time stamp, no base address
  # derived from the output's name.
  target_compile_options(qel_options INTERFACE
    -fstack-protector-strong -ffile-prefix-map=${PROJECT_SOURCE_DIR}=. -ffile-prefix-map=${PROJECT_BINARY_DIR}=./build)
  target_link_options(qel_options INTERFACE -static -fstack-protector-strong -Wl,--no-insert-timestamp -Wl,--disable-auto-image-base)
else()
  # Not for Windows, where every COM interface would be reported.
  target_compile_options(qel_options INTERFACE -Wnon-virtual-dtor)
endif()

# qel_add_layer(NAME SOURCES file... [USES layer...])
function(qel_add_layer name)
  cmake_parse_arguments(LAYER "" "" "SOURCES;USES" ${ARGN})
  add_library(${name} STATIC ${LAYER_SOURCES})
  target_include_directories(${name} PUBLIC ${CMAKE_CURRENT_SOURCE_DIR})
  target_link_libraries(${name} PUBLIC ${LAYER_USES} PRIVATE qel_options)
  qel_add_symbols(${name})
endfunction()
