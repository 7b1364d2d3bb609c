// Resource identifiers of the registry scripts, for C++ and for the resource compiler, which understands only
// macros.
#pragma once

// NOLINTBEGIN(modernize-macro-to-enum)
#define IDR_MODULE 101
#define IDR_SHELL_EXT 102
#define IDR_ALI 103
#define IDR_EBN 104
#define IDR_EMI 105
#define IDR_MRC 106
#define IDR_RAW 107
#define IDR_REC 108
#define IDR_SER 109
// NOLINTEND(modernize-macro-to-enum)
