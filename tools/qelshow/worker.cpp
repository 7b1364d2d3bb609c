#include "worker.h"

#include <objbase.h>

#include <algorithm>
#include <cstdint>

#include "diagnosis.h"
#include "extension_client.h"
#include "failure.h"
#include "shell_requests.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

bool WriteAll(HANDLE pipe, const char* bytes, std::size_t size) {
  while (size > 0) {
    DWORD written = 0;
    const auto part = static_cast<DWORD>(std::min<std::size_t>(size, 1 << 20));
    if (!WriteFile(pipe, bytes, part, &written, nullptr) || written == 0) return false;
    bytes += written;
    size -= written;
  }
  return true;
}

bool ReadAll(HANDLE pipe, char* bytes, std::size_t size) {
  while (size > 0) {
    DWORD read = 0;
    const auto part = static_cast<DWORD>(std::min<std::size_t>(size, 1 << 20));
    if (!ReadFile(pipe, bytes, part, &read, nullptr) || read == 0) return false;
    bytes += read;
    size -= read;
  }
  return true;
}

/// A message is preceded by its length.
bool Send(HANDLE pipe, const std::string& message) {
  const std::uint64_t size = message.size();
  return WriteAll(pipe, reinterpret_cast<const char*>(&size), sizeof size) &&
         WriteAll(pipe, message.data(), message.size());
}

bool Receive(HANDLE pipe, std::string& message) {
  std::uint64_t size = 0;
  if (!ReadAll(pipe, reinterpret_cast<char*>(&size), sizeof size)) return false;
  message.resize(static_cast<std::size_t>(size));
  return ReadAll(pipe, message.data(), message.size());
}

std::string AnswerTo(const Question& question, const ExtensionClient& client) {
  switch (question.subject) {
    case Subject::kDiagnosis: return Packed(Diagnose(question.path));
    case Subject::kTip: return Packed(RequestTip(client, question.path));
    case Subject::kColumns: return Packed(RequestColumns(client, question.path));
    case Subject::kPropertySets: return Packed(RequestPropertySets(client, question.path));
    case Subject::kPropertyStore: return Packed(RequestPropertyStore(client, question.path));
    case Subject::kThumbnail: return Packed(RequestThumbnail(client, question.path, question.size));
    case Subject::kCreation: return Packed(RequestObject(question.path));
  }
  return {};
}

/// Ends the process at once and without a dialog; the parent process reads the code and reports it.
LONG WINAPI EndProcess(EXCEPTION_POINTERS* fault) {
  TerminateProcess(GetCurrentProcess(), fault->ExceptionRecord->ExceptionCode);
  return EXCEPTION_EXECUTE_HANDLER;
}

/// A pipe of which the child process inherits one end.
bool MakePipe(OwnedHandle& readEnd, OwnedHandle& writeEnd, const OwnedHandle& kept) {
  SECURITY_ATTRIBUTES inheritable = {sizeof inheritable, nullptr, TRUE};
  HANDLE read = nullptr;
  HANDLE write = nullptr;
  if (!CreatePipe(&read, &write, &inheritable, 0)) return false;
  readEnd.reset(read);
  writeEnd.reset(write);
  return SetHandleInformation(kept.get(), HANDLE_FLAG_INHERIT, 0) != 0;
}

}  // namespace

int RunWorker() {
  SetErrorMode(SEM_FAILCRITICALERRORS | SEM_NOGPFAULTERRORBOX | SEM_NOOPENFILEERRORBOX);
  SetUnhandledExceptionFilter(&EndProcess);
  const HANDLE input = GetStdHandle(STD_INPUT_HANDLE);
  const HANDLE output = GetStdHandle(STD_OUTPUT_HANDLE);
  // The shell asks from a single-threaded apartment.
  if (FAILED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED))) return 1;

  std::string message;
  if (!Receive(input, message)) return 1;
  ExtensionClient client;
  if (!Send(output, Packed(client.Open(Unpacked<std::wstring>(message))))) return 1;
  while (Receive(input, message)) {
    if (!Send(output, AnswerTo(Unpacked<Question>(message), client))) return 1;
  }
  return 0;
}

void Worker::Start() {
  OwnedHandle childInput;
  OwnedHandle childOutput;
  if (!MakePipe(childInput, toProcess_, toProcess_) || !MakePipe(fromProcess_, childOutput, fromProcess_)) {
    throw Failure(L"A pipe cannot be made: " + SystemErrorText(GetLastError()) + L".");
  }
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdInput = childInput.get();
  startup.hStdOutput = childOutput.get();
  startup.hStdError = GetStdHandle(STD_ERROR_HANDLE);
  const std::wstring program = OwnPath();
  std::wstring command = L"\"" + program + L"\" " + kWorkerArgument;
  PROCESS_INFORMATION process{};
  if (!CreateProcessW(program.c_str(), command.data(), nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup,
                      &process)) {
    throw Failure(L"The program cannot start itself again: " + SystemErrorText(GetLastError()) + L".");
  }
  CloseHandle(process.hThread);
  process_.reset(process.hProcess);
  childInput.reset();
  childOutput.reset();

  std::string reply;
  if (!Send(toProcess_.get(), Packed(dllPath_)) || !Receive(fromProcess_.get(), reply)) {
    throw Failure(L"The extension ends its process with " + ProcessEndText(Finish()) +
                  L" while it is loaded.");
  }
  const auto problem = Unpacked<std::wstring>(reply);
  if (!problem.empty()) throw Failure(problem);
}

std::optional<DWORD> Worker::Transmit(const std::string& message, std::string& reply) {
  if (Send(toProcess_.get(), message) && Receive(fromProcess_.get(), reply)) return std::nullopt;
  const DWORD end = Finish();
  Start();
  return end;
}

DWORD Worker::Finish() {
  toProcess_.reset();
  fromProcess_.reset();
  WaitForSingleObject(process_.get(), INFINITE);
  DWORD exitCode = 0;
  GetExitCodeProcess(process_.get(), &exitCode);
  process_.reset();
  return exitCode;
}

}  // namespace Qel::Lumetra::ShellExt::Show
