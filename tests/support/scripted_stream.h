// A COM stream for tests: it returns its bytes in pieces of any size, fails on demand and counts the calls.
#pragma once

#include <objidl.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <string>
#include <utility>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// The test owns the stream. The reference count does not control the lifetime; tests only check it.
class ScriptedStream final : public IStream {
 public:
  explicit ScriptedStream(std::string bytes) : content(std::move(bytes)) {}

  ULONG maxPerRead = std::numeric_limits<ULONG>::max();
  ULONG maxPerWrite = std::numeric_limits<ULONG>::max();
  HRESULT readResult = S_OK;  // of a Read that returns bytes
  HRESULT endResult = S_OK;   // of a Read at the end of the bytes
  int failingRead = 0;        // the Read that fails, counted from 1; 0 for none
  HRESULT readFailure = STG_E_READFAULT;
  HRESULT writeResult = S_OK;  // a Write that fails writes nothing
  ULONG overclaim = 0;         // by how many bytes a Read overstates what it returned

  std::string content;
  std::size_t position = 0;
  std::string written;

  ULONG references = 1;
  int reads = 0;
  int writes = 0;
  int otherCalls = 0;         // all except AddRef, Release, Read and Write
  std::vector<ULONG> wanted;  // the bytes that each Read requested

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID, void** object) override {
    ++otherCalls;
    *object = nullptr;
    return E_NOINTERFACE;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
  ULONG STDMETHODCALLTYPE Release() override { return --references; }

  HRESULT STDMETHODCALLTYPE Read(void* bytes, ULONG count, ULONG* read) override {
    wanted.push_back(count);
    if (++reads == failingRead) {
      // A failing stream may still have written to the buffer.
      std::memset(bytes, '!', count);
      *read = 0;
      return readFailure;
    }
    const std::size_t delivered =
        std::min({content.size() - position, std::size_t{count}, std::size_t{maxPerRead}});
    std::memcpy(bytes, content.data() + position, delivered);
    position += delivered;
    *read = static_cast<ULONG>(delivered) + (delivered == 0 ? 0 : overclaim);
    return delivered == 0 ? endResult : readResult;
  }

  HRESULT STDMETHODCALLTYPE Write(const void* bytes, ULONG count, ULONG* taken) override {
    ++writes;
    *taken = writeResult < 0 ? 0 : std::min(count, maxPerWrite);
    written.append(static_cast<const char*>(bytes), *taken);
    return writeResult;
  }

  HRESULT STDMETHODCALLTYPE Seek(LARGE_INTEGER, DWORD, ULARGE_INTEGER*) override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE SetSize(ULARGE_INTEGER) override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE CopyTo(IStream*, ULARGE_INTEGER, ULARGE_INTEGER*, ULARGE_INTEGER*) override {
    return Refuse();
  }
  HRESULT STDMETHODCALLTYPE Commit(DWORD) override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE Revert() override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE LockRegion(ULARGE_INTEGER, ULARGE_INTEGER, DWORD) override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE UnlockRegion(ULARGE_INTEGER, ULARGE_INTEGER, DWORD) override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE Stat(STATSTG*, DWORD) override { return Refuse(); }
  HRESULT STDMETHODCALLTYPE Clone(IStream**) override { return Refuse(); }

 private:
  HRESULT Refuse() {
    ++otherCalls;
    return E_NOTIMPL;
  }
};

}  // namespace Qel::Lumetra::ShellExt::Testing
