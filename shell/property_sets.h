// The property sets of a file, through which older clients of the shell read its properties.
#pragma once

#include <windows.h>

#include <objidl.h>

#include <map>
#include <memory>

#include "com_ptr.h"
#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Orders format identifiers by Data1, Data2, Data3 and then the bytes of Data4.
struct FormatIdLess {
  bool operator()(const FMTID& a, const FMTID& b) const;
};

using PropertySets = std::map<FMTID, Com::ComPtr<IPropertyStorage>, FormatIdLess>;

/// Makes the sets of the valid file that `reader` reads: the summary, which has the comment, and the image
/// summary, which has everything else. Returns the failure to create a set or to add a value; `sets` is
/// written on success only.
HRESULT BuildPropertySets(const FileTypeInfo& reader, std::shared_ptr<const PropertySets>& sets);

}  // namespace Qel::Lumetra::ShellExt
