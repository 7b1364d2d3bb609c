// Runs programs for tests.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// Runs a program and returns its exit status. The arguments must not contain double quotes or end in a
/// backslash. Throws std::runtime_error if the program cannot be started or does not end within a minute.
std::uint32_t RunProcess(const std::filesystem::path& program, const std::vector<std::wstring>& arguments);

}  // namespace Qel::Lumetra::ShellExt::Testing
