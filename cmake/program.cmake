# What a user gets: programs without symbols, and beside each of them a file that has the symbols and lines of its
# code, NAME.debug, for a debugger or addr2line.

# qel_add_symbols(TARGET): compiles the sources of a library or program with debug information. The code is the same.
function(qel_add_symbols target)
  if(WIN32)
    target_compile_options(${target} PRIVATE $<$<COMPILE_LANGUAGE:CXX>:-g>)
  endif()
endfunction()

# qel_separate_symbols(TARGET): leaves TARGET as it is released, with a reference to the file of its symbols.
function(qel_separate_symbols target)
  qel_add_symbols(${target})
  set(program $<TARGET_FILE_NAME:${target}>)
  # It would write the time into the program.
  set(objcopy ${CMAKE_COMMAND} -E env SOURCE_DATE_EPOCH=0 ${CMAKE_OBJCOPY})
  add_custom_command(TARGET ${target} POST_BUILD WORKING_DIRECTORY $<TARGET_FILE_DIR:${target}> VERBATIM
    COMMAND ${objcopy} --only-keep-debug ${program} ${program}.debug
    COMMAND ${objcopy} --strip-all --add-gnu-debuglink=${program}.debug ${program})
  set_property(TARGET ${target} APPEND PROPERTY ADDITIONAL_CLEAN_FILES $<TARGET_FILE:${target}>.debug)
endfunction()
