#include "worker.h"

#include <objbase.h>

#include <algorithm>
#include <cstdint>
#include <vector>

#include "console.h"
#include "diagnosis.h"
#include "extension_client.h"
#include "failure.h"
#include "shell_requests.h"
#include "shell_view.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

using Com::OwnedHandle;

bool ReadAll(HANDLE pipe, void* bytes, std::size_t size) {
  char* next = static_cast<char*>(bytes);
  while (size > 0) {
    DWORD read = 0;
    const auto part = static_cast<DWORD>(std::min<std::size_t>(size, 1 << 20));
    if (!ReadFile(pipe, next, part, &read, nullptr) || read == 0) return false;
    next += read;
    size -= read;
  }
  return true;
}

/// Sends the length of a message, then the message. Returns whether it has been sent.
bool Send(HANDLE pipe, const Json& message) {
  const std::vector<std::uint8_t> bytes = Json::to_cbor(message);
  const std::uint64_t size = bytes.size();
  return WriteBytes(pipe, &size, sizeof size) && WriteBytes(pipe, bytes.data(), bytes.size());
}

bool Receive(HANDLE pipe, Json& message) {
  std::uint64_t size = 0;
  if (!ReadAll(pipe, &size, sizeof size)) return false;
  std::vector<std::uint8_t> bytes(static_cast<std::size_t>(size));
  if (!ReadAll(pipe, bytes.data(), bytes.size())) return false;
  message = Json::from_cbor(bytes);
  return true;
}

Json AnswerTo(const Question& question, ExtensionClient& client) {
  switch (question.subject) {
    case Subject::kLoading: return client.Open(question.path);
    case Subject::kDiagnosis: return Diagnose(question.path);
    case Subject::kTip: return RequestTip(client, question.path);
    case Subject::kColumns: return RequestColumns(client, question.path);
    case Subject::kPropertySets: return RequestPropertySets(client, question.path);
    case Subject::kPropertyStore: return RequestPropertyStore(client, question.path);
    case Subject::kThumbnail: return RequestThumbnail(client, question.path, question.size);
    case Subject::kShellView: return RequestShellView(client, question.path, question.size);
    case Subject::kCreation: return RequestObject(question.path);
  }
  return {};
}

/// Ends the process at once and without a dialog. The parent process reports the exit code.
LONG WINAPI EndProcess(EXCEPTION_POINTERS* fault) {
  TerminateProcess(GetCurrentProcess(), fault->ExceptionRecord->ExceptionCode);
  return EXCEPTION_EXECUTE_HANDLER;
}

/// Makes a pipe. The child process inherits the end that is not `kept`. Returns whether this succeeded.
bool MakePipe(OwnedHandle& readEnd, OwnedHandle& writeEnd, const OwnedHandle& kept) {
  SECURITY_ATTRIBUTES inheritable = {sizeof inheritable, nullptr, TRUE};
  return CreatePipe(readEnd.Put(), writeEnd.Put(), &inheritable, 0) &&
         SetHandleInformation(kept.Get(), HANDLE_FLAG_INHERIT, 0) != 0;
}

}  // namespace

int RunWorker() {
  SetErrorMode(SEM_FAILCRITICALERRORS | SEM_NOGPFAULTERRORBOX | SEM_NOOPENFILEERRORBOX);
  SetUnhandledExceptionFilter(&EndProcess);
  const HANDLE input = GetStdHandle(STD_INPUT_HANDLE);
  const HANDLE output = GetStdHandle(STD_OUTPUT_HANDLE);
  // The shell uses the extension in a single-threaded apartment.
  if (FAILED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED))) return 1;

  ExtensionClient client;
  Json message;
  while (Receive(input, message)) {
    if (!Send(output, AnswerTo(message.get<Question>(), client))) return 1;
  }
  return 0;
}

void Worker::Start() {
  OwnedHandle childInput;
  OwnedHandle childOutput;
  if (!MakePipe(childInput, toProcess_, toProcess_) || !MakePipe(fromProcess_, childOutput, fromProcess_)) {
    throw Failure(L"qelshow cannot create a pipe to its worker process: " + SystemErrorText(GetLastError()) +
                  L".");
  }
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdInput = childInput.Get();
  startup.hStdOutput = childOutput.Get();
  startup.hStdError = GetStdHandle(STD_ERROR_HANDLE);
  const std::wstring program = OwnPath();
  std::wstring command = L"\"" + program + L"\" " + kWorkerArgument;
  PROCESS_INFORMATION process{};
  if (!CreateProcessW(program.c_str(), command.data(), nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup,
                      &process)) {
    throw Failure(L"qelshow cannot start its worker process: " + SystemErrorText(GetLastError()) + L".");
  }
  const OwnedHandle thread(process.hThread);
  process_ = OwnedHandle(process.hProcess);
  childInput.Reset();
  childOutput.Reset();

  Json reply;
  if (!Exchange({Subject::kLoading, dllPath_}, reply)) {
    throw Failure(L"The extension crashed while it was being loaded: " + ProcessEndText(Finish()) + L".");
  }
  const auto problem = reply.get<std::wstring>();
  if (!problem.empty()) throw Failure(problem);
}

bool Worker::Exchange(const Question& question, Json& reply) {
  return Send(toProcess_.Get(), question) && Receive(fromProcess_.Get(), reply);
}

std::optional<DWORD> Worker::Transmit(const Question& question, Json& reply) {
  if (Exchange(question, reply)) return std::nullopt;
  const DWORD end = Finish();
  Start();
  return end;
}

DWORD Worker::Finish() {
  toProcess_.Reset();
  fromProcess_.Reset();
  WaitForSingleObject(process_.Get(), INFINITE);
  DWORD exitCode = 0;
  GetExitCodeProcess(process_.Get(), &exitCode);
  process_.Reset();
  return exitCode;
}

}  // namespace Qel::Lumetra::ShellExt::Show
