// Resource identifiers of the module's strings, for C++ and for the resource compiler, which understands only
// macros. The strings are in the server's string table (string_table.rc).
//
// The type descriptions of the readers have identifiers too (formats/file_kinds.h). The table intentionally
// omits them, so every type description is empty.
#pragma once

// NOLINTBEGIN(modernize-macro-to-enum)
#define IDS_MODULE_NAME 100
#define IDS_DIMENSIONS 200
#define IDS_SIZE 201
#define IDS_TYPE 202
#define IDS_IMAGES 203
#define IDS_DATE_MODIFIED 204
#define IDS_COMMENTS 205
#define IDS_WIDTH 206
#define IDS_HEIGHT 207
#define IDS_FRAME_COUNT 208
#define IDS_BIT_DEPTH 209
// NOLINTEND(modernize-macro-to-enum)
