// Programs that a test runs.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// Runs a program to its end and returns its exit status. Arguments may hold anything but double quotes and
/// must not end in a backslash. Throws std::runtime_error if the program cannot be started or does not end
/// within a minute.
std::uint32_t RunProcess(const std::filesystem::path& program, const std::vector<std::wstring>& arguments);

}  // namespace Qel::Lumetra::ShellExt::Testing
