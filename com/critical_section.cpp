#include "critical_section.h"

namespace Qel::Com {

CriticalSection::~CriticalSection() {
  if (created_) DeleteCriticalSection(&section_);
}

HRESULT CriticalSection::Create() {
  created_ = InitializeCriticalSectionAndSpinCount(&section_, 0) != FALSE;
  return created_ ? S_OK : HRESULT_FROM_WIN32(GetLastError());
}

}  // namespace Qel::Com
