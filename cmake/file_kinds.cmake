# The list of file kinds, read from formats/file_kinds.h.
#
# QEL_FILE_EXTENSIONS lists every file-name extension without its dot, in the order of registration. QEL_FILE_KINDS
# lists the prefix of each parser's source files. QEL_EXTENSIONS_IN_WORDS is for sentences, for instance ".mrc, .ser and
# .raw".
set(file_kinds_header ${PROJECT_SOURCE_DIR}/formats/file_kinds.h)
set_property(DIRECTORY ${PROJECT_SOURCE_DIR} APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${file_kinds_header})
file(STRINGS ${file_kinds_header} rows REGEX "^ *FileKind<[A-Za-z0-9]+Parser>{L\"[a-z0-9]+\"")
foreach(row IN LISTS rows)
  string(REGEX MATCH "<([A-Za-z0-9]+)Parser>{L\"([a-z0-9]+)\"" row ${row})
  string(TOLOWER ${CMAKE_MATCH_1} parser)
  list(APPEND QEL_FILE_EXTENSIONS ${CMAKE_MATCH_2})
  list(APPEND QEL_FILE_KINDS ${parser})
endforeach()
list(REMOVE_DUPLICATES QEL_FILE_KINDS)
list(JOIN QEL_FILE_EXTENSIONS ", ." QEL_EXTENSIONS_IN_WORDS)
string(REGEX REPLACE "(.*), " ".\\1 and " QEL_EXTENSIONS_IN_WORDS "${QEL_EXTENSIONS_IN_WORDS}")
if(NOT QEL_FILE_KINDS)
  message(FATAL_ERROR "${file_kinds_header} has no row in the form that cmake/file_kinds.cmake reads")
endif()
