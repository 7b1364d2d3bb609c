# Options for every target of the project, and the function that adds a layer.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

# Thumbnails are exact to the bit, so the compiler must never fuse a product and a sum into one rounding. No code reads
# the floating-point exception flags; without them more loops are vectorised, with the same results.
add_library(qel_options INTERFACE)
target_compile_options(qel_options INTERFACE
  -Wall -Wextra -Wpedantic -Werror -Wshadow -Wconversion -Wsign-conversion -Wswitch
  -Woverloaded-virtual -Wcast-qual -Wformat=2
  -ffp-contract=off -fno-trapping-math)
target_compile_definitions(qel_options INTERFACE _GLIBCXX_ASSERTIONS)

if(WIN32)
  target_compile_definitions(qel_options INTERFACE
    UNICODE _UNICODE NOMINMAX WIN32_LEAN_AND_MEAN STRICT WINVER=0x0601 _WIN32_WINNT=0x0601 NTDDI_VERSION=0x06010000)
  # A release has the same bytes wherever it is built: no folder names, no time stamp, no base address derived from the
  # output's name.
  target_compile_options(qel_options INTERFACE
    -fstack-protector-strong -ffile-prefix-map=${PROJECT_SOURCE_DIR}=. -ffile-prefix-map=${PROJECT_BINARY_DIR}=./build)
  target_link_options(qel_options INTERFACE -static -fstack-protector-strong -Wl,--no-insert-timestamp -Wl,--disable-auto-image-base)
else()
  # Not for Windows, because the warning applies to every COM interface.
  target_compile_options(qel_options INTERFACE -Wnon-virtual-dtor)
endif()

# qel_add_layer(NAME SOURCES file... [USES layer...])
# Adds the static library NAME with its folder as include path. USES names the layers and libraries that it depends on.
function(qel_add_layer name)
  cmake_parse_arguments(LAYER "" "" "SOURCES;USES" ${ARGN})
  add_library(${name} STATIC ${LAYER_SOURCES})
  target_include_directories(${name} PUBLIC ${CMAKE_CURRENT_SOURCE_DIR})
  target_link_libraries(${name} PUBLIC ${LAYER_USES} PRIVATE qel_options)
  qel_add_symbols(${name})
endfunction()
