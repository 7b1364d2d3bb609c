# Separates the debug symbols from the programs that users get. NAME.debug, next to the program NAME, has its symbols
# and line numbers for a debugger or addr2line.

# qel_add_symbols(TARGET)
# Compiles the sources of a library or program with debug information, which does not change the code.
function(qel_add_symbols target)
  if(WIN32)
    target_compile_options(${target} PRIVATE $<$<COMPILE_LANGUAGE:CXX>:-g>)
  endif()
endfunction()

# qel_separate_symbols(TARGET)
# Strips TARGET to the form in which it is released, with a reference to its symbol file.
function(qel_separate_symbols target)
  qel_add_symbols(${target})
  set(program $<TARGET_FILE_NAME:${target}>)
  # Without SOURCE_DATE_EPOCH objcopy writes the current time into the program.
  set(objcopy ${CMAKE_COMMAND} -E env SOURCE_DATE_EPOCH=0 ${CMAKE_OBJCOPY})
  add_custom_command(TARGET ${target} POST_BUILD WORKING_DIRECTORY $<TARGET_FILE_DIR:${target}> VERBATIM
    COMMAND ${objcopy} --only-keep-debug ${program} ${program}.debug
    COMMAND ${objcopy} --strip-all --add-gnu-debuglink=${program}.debug ${program})
  set_property(TARGET ${target} APPEND PROPERTY ADDITIONAL_CLEAN_FILES $<TARGET_FILE:${target}>.debug)
endfunction()
