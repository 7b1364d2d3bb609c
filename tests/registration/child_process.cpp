#include "child_process.h"

#include <windows.h>

#include <stdexcept>

namespace Qel::Lumetra::ShellExt::Testing {

std::uint32_t RunProcess(const std::filesystem::path& program, const std::vector<std::wstring>& arguments) {
  std::wstring line = L"\"" + program.wstring() + L"\"";
  for (const std::wstring& argument : arguments) line += L" \"" + argument + L"\"";

  STARTUPINFOW startup{};
  startup.cb = sizeof(startup);
  PROCESS_INFORMATION process{};
  if (!CreateProcessW(program.c_str(), line.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                      &process)) {
    throw std::runtime_error("cannot start " + program.string());
  }
  DWORD status = STILL_ACTIVE;
  const bool hasEnded = WaitForSingleObject(process.hProcess, 60'000) == WAIT_OBJECT_0;
  GetExitCodeProcess(process.hProcess, &status);
  if (!hasEnded) TerminateProcess(process.hProcess, 1);
  CloseHandle(process.hThread);
  CloseHandle(process.hProcess);
  if (!hasEnded) throw std::runtime_error(program.string() + " does not end");
  return status;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
