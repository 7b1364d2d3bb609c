// IDs of the program's resources.
#pragma once

#define IDR_PAGE 101
