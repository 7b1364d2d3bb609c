// run_tests: runs every test program in its folder, one after the other, and counts their tests. A test
// program is a program of GoogleTest whose name ends in _test.exe. Its current folder is the subfolder data.
// Its output goes to test-log.txt in the parent folder.
//
// Exits with 0 if tests have passed and none has failed, with 2 if the log cannot be written, and with 1
// otherwise.
#include <windows.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace {

namespace fs = std::filesystem;

/// The time limit of a program in milliseconds. A program that takes longer is ended and counts as failed.
constexpr DWORD kLongestRun = 30 * 60 * 1000;

struct Results {
  int passed = 0;
  int failed = 0;
  int skipped = 0;
  std::set<std::string> reasons;  // why tests have been skipped

  void Add(const Results& other) {
    passed += other.passed;
    failed += other.failed;
    skipped += other.skipped;
    reasons.insert(other.reasons.begin(), other.reasons.end());
  }
};

std::string Text(const Results& results) {
  return std::to_string(results.passed) + " passed, " + std::to_string(results.failed) + " failed, " +
         std::to_string(results.skipped) + " skipped";
}

/// Counts the tests in the output of a program. A test that has begun but has neither passed nor been skipped
/// counts as failed: it may have ended the program.
Results Count(std::string_view output) {
  Results results;
  bool isInTest = false;
  bool isReason = false;
  int begun = 0;
  while (!output.empty()) {
    const std::size_t end = std::min(output.find('\n'), output.size());
    std::string_view line = output.substr(0, end);
    output.remove_prefix(std::min(end + 1, output.size()));
    if (line.ends_with('\r')) line.remove_suffix(1);

    if (isReason) results.reasons.emplace(line);
    isReason = line.ends_with(": Skipped");
    if (line.starts_with("[ RUN      ] ")) {
      ++begun;
      isInTest = true;
    } else if (isInTest && line.starts_with("[       OK ] ")) {
      ++results.passed;
      isInTest = false;
    } else if (isInTest && line.starts_with("[  SKIPPED ] ")) {
      ++results.skipped;
      isInTest = false;
    }
  }
  results.failed = begun - results.passed - results.skipped;
  return results;
}

/// The log, to which both this program and the tests write.
class Log {
 public:
  /// Creates an empty file. Child processes inherit its handle.
  explicit Log(const fs::path& path) {
    SECURITY_ATTRIBUTES inheritable = {sizeof inheritable, nullptr, TRUE};
    file_ = CreateFileW(path.c_str(), GENERIC_READ | GENERIC_WRITE, FILE_SHARE_READ | FILE_SHARE_WRITE,
                        &inheritable, CREATE_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
  }
  ~Log() { CloseHandle(file_); }
  Log(const Log&) = delete;
  Log& operator=(const Log&) = delete;

  bool isOpen() const { return file_ != INVALID_HANDLE_VALUE; }
  HANDLE file() const { return file_; }

  void Write(std::string_view text) const {
    DWORD written = 0;
    WriteFile(file_, text.data(), static_cast<DWORD>(text.size()), &written, nullptr);
  }

  /// Writes a line to the log and to standard output.
  void Say(const std::string& line) const {
    std::puts(line.c_str());
    std::fflush(stdout);
    Write(line + "\r\n");
  }

  LONGLONG Size() const {
    LARGE_INTEGER size{};
    GetFileSizeEx(file_, &size);
    return size.QuadPart;
  }

  /// Returns what has been written since the log had `size` bytes.
  std::string Since(LONGLONG size) const {
    std::string text(static_cast<std::size_t>(Size() - size), '\0');
    Seek(size, FILE_BEGIN);
    DWORD read = 0;
    if (!ReadFile(file_, text.data(), static_cast<DWORD>(text.size()), &read, nullptr)) read = 0;
    text.resize(read);
    Seek(0, FILE_END);
    return text;
  }

 private:
  void Seek(LONGLONG distance, DWORD from) const {
    LARGE_INTEGER position{};
    position.QuadPart = distance;
    SetFilePointerEx(file_, position, nullptr, from);
  }

  HANDLE file_;
};

/// Runs a program to its end. Returns whether it exits with 0. Otherwise it logs how the program ended,
/// unless the status is 1, the status of failed tests.
bool Run(const fs::path& program, const Log& log) {
  std::wstring command = L"\"" + program.wstring() + L"\" --gtest_color=no";
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdOutput = startup.hStdError = log.file();
  PROCESS_INFORMATION process{};
  if (!CreateProcessW(program.c_str(), command.data(), nullptr, nullptr, TRUE, 0, nullptr,
                      (program.parent_path() / L"data").c_str(), &startup, &process)) {
    log.Say("  Could not be started: error " + std::to_string(GetLastError()) + ".");
    return false;
  }
  const bool hasEnded = WaitForSingleObject(process.hProcess, kLongestRun) == WAIT_OBJECT_0;
  if (!hasEnded) TerminateProcess(process.hProcess, 1);
  DWORD status = 1;
  GetExitCodeProcess(process.hProcess, &status);
  CloseHandle(process.hThread);
  CloseHandle(process.hProcess);
  if (!hasEnded) log.Say("  Did not end within 30 minutes.");
  if (hasEnded && status > 1) log.Say("  Exited with status " + std::to_string(status) + ".");
  return hasEnded && status == 0;
}

Results RunTests(const fs::path& program, const Log& log) {
  log.Write("== " + program.filename().string() + "\r\n");
  const LONGLONG before = log.Size();
  const bool succeeded = Run(program, log);
  Results results = Count(log.Since(before));
  const bool hasRun = results.passed + results.failed + results.skipped > 0;
  if ((!succeeded || !hasRun) && results.failed == 0) results.failed = 1;
  return results;
}

std::vector<fs::path> TestPrograms(const fs::path& folder) {
  std::vector<fs::path> programs;
  for (const auto& entry : fs::directory_iterator(folder)) {
    if (entry.path().filename().wstring().ends_with(L"_test.exe")) programs.push_back(entry.path());
  }
  std::ranges::sort(programs);
  return programs;
}

/// Returns the version of Windows. GetVersion would return the version that the program's manifest names.
std::string WindowsVersion() {
  using GetTrueVersion = LONG WINAPI(OSVERSIONINFOW*);
  const auto getVersion = reinterpret_cast<GetTrueVersion*>(
      reinterpret_cast<void*>(GetProcAddress(GetModuleHandleW(L"ntdll.dll"), "RtlGetVersion")));
  OSVERSIONINFOW version{};
  version.dwOSVersionInfoSize = sizeof version;
  getVersion(&version);
  return "Windows " + std::to_string(version.dwMajorVersion) + "." + std::to_string(version.dwMinorVersion) +
         "." + std::to_string(version.dwBuildNumber);
}

}  // namespace

int main() {
  // Some tests end processes on purpose. Child processes inherit this mode, so no dialog appears.
  SetErrorMode(SEM_FAILCRITICALERRORS | SEM_NOGPFAULTERRORBOX | SEM_NOOPENFILEERRORBOX);
  std::wstring path(32768, L'\0');
  path.resize(GetModuleFileNameW(nullptr, path.data(), static_cast<DWORD>(path.size())));
  const fs::path folder = fs::path(path).parent_path();
  const Log log(folder.parent_path() / L"test-log.txt");
  if (!log.isOpen()) {
    std::puts("test-log.txt cannot be written. Unpack the tests into a folder in which you may write.");
    return 2;
  }
  log.Say(WindowsVersion());
  Results all;
  for (const fs::path& program : TestPrograms(folder)) {
    const Results results = RunTests(program, log);
    log.Say(program.stem().string() + ": " + Text(results));
    for (const std::string& reason : results.reasons) log.Say("  Skipped: " + reason);
    all.Add(results);
  }
  log.Say(Text(all));
  return all.failed == 0 && all.passed > 0 ? 0 : 1;
}
