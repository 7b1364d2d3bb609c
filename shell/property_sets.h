// The property sets of a file, the older way in which the shell asks for its properties.
#pragma once

#include <windows.h>

#include <objidl.h>

#include <map>
#include <memory>

#include "com_ptr.h"
#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Orders format ids by their fields, the bytes of the last one in turn.
struct FormatIdLess {
  bool operator()(const FMTID& a, const FMTID& b) const;
};

using PropertySets = std::map<FMTID, Com::ComPtr<IPropertyStorage>, FormatIdLess>;

/// Makes the sets of the valid file that `reader` reads: the summary, which holds the comment, and the image
/// summary, which holds everything else. Fails with what a part of them fails with; `sets` is written on
/// success only.
HRESULT BuildPropertySets(const FileTypeInfo& reader, std::shared_ptr<const PropertySets>& sets);

}  // namespace Qel::Lumetra::ShellExt
