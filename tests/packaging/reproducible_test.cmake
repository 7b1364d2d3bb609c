# Copies the sources to another folder whose name is difficult for tools, makes the packages there from
# scratch, and compares them byte by byte with the packages of this build.
#
# The test kit is left out: its programs take most of the time to build. They are compiled with the options of the
# released programs, and Windows.package.Contents finds the name of a build folder in any of them.
#
# cmake -D SOURCE=FOLDER -D BUILD=FOLDER -D WORK=FOLDER -P reproducible_test.cmake
set(copy "${WORK}/a/copy's folder & (ä Ω 樹)")
file(REMOVE_RECURSE ${WORK})
file(GLOB sources RELATIVE ${SOURCE} ${SOURCE}/*)
list(REMOVE_ITEM sources .git build)
foreach(item ${sources})
  file(COPY ${SOURCE}/${item} DESTINATION "${copy}")
endforeach()

set(ENV{SOURCE_DATE_EPOCH} 1700000000)
set(ENV{CCACHE_DISABLE} 1)
execute_process(COMMAND ${SOURCE}/scripts/package --without-tests --out ${WORK}/first COMMAND_ERROR_IS_FATAL ANY)
execute_process(COMMAND "${copy}/scripts/package" --without-tests --out ${WORK}/second COMMAND_ERROR_IS_FATAL ANY)

file(STRINGS ${WORK}/first/SHA256SUMS packages)
list(TRANSFORM packages REPLACE "^[0-9a-f]+  " "")
list(LENGTH packages count)
if(NOT count EQUAL 4)
  message(FATAL_ERROR "There are ${count} packages: ${packages}.")
endif()
foreach(package ${packages})
  file(SHA256 ${WORK}/first/${package} first)
  file(SHA256 ${WORK}/second/${package} second)
  if(NOT first STREQUAL second)
    message(FATAL_ERROR "${WORK}/second/${package} differs from the package in ${WORK}/first.")
  endif()
endforeach()
file(REMOVE_RECURSE ${WORK})
