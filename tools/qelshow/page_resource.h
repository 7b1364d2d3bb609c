// IDs of the program's resources.
#pragma once

#define IDR_PAGE 101  // NOLINT(modernize-macro-to-enum): the resource compiler understands only macros
