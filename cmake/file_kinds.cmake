# The list of file kinds, read from formats/file_kinds.h.
#
# QEL_FILE_EXTENSIONS has every extension, in the order of registration, without the dot. QEL_FILE_KINDS has the
# first extension of every parser: the name that the parser's files begin with. QEL_EXTENSIONS_IN_WORDS is for
# sentences, for instance ".mrc, .ser and .raw".
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
  message(FATAL_ERROR "${file_kinds_header} has no rows that can be read here")
endif()
