# Builds the DLL from a copy of the sources in another folder, one with a name that is hard on tools, and
# compares the two byte by byte.
#
# cmake -D SOURCE=FOLDER -D DLL=FILE -D WORK=FOLDER -P reproducible_test.cmake
set(copy "${WORK}/a/copy's folder & (ä Ω 樹)")
set(build ${WORK}/build)
file(REMOVE_RECURSE ${WORK})
file(COPY ${SOURCE}/ DESTINATION "${copy}" PATTERN build EXCLUDE PATTERN .git EXCLUDE)

# Compiled anew, not taken from a cache of the first build.
set(ENV{CCACHE_DISABLE} 1)
foreach(command
    "${CMAKE_COMMAND};--preset;windows;-B;${build};-D;QEL_BUILD_TESTS=OFF"
    "${CMAKE_COMMAND};--build;${build};--target;QelShellExt")
  execute_process(COMMAND ${command} WORKING_DIRECTORY "${copy}" COMMAND_ERROR_IS_FATAL ANY)
endforeach()

file(SHA256 ${DLL} first)
file(SHA256 ${build}/QelShellExt.dll second)
if(NOT first STREQUAL second)
  message(FATAL_ERROR "${build}/QelShellExt.dll differs from ${DLL}.")
endif()
file(REMOVE_RECURSE ${WORK})
