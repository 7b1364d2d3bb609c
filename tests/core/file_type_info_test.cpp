#include "file_type_info.h"

#include <gtest/gtest.h>

#include <type_traits>

namespace Qel::Lumetra::ShellExt {
namespace {

TEST(FileTypeInfo, IsAPureInterface) {
  EXPECT_TRUE(std::is_abstract_v<FileTypeInfo>);
  EXPECT_TRUE(std::has_virtual_destructor_v<FileTypeInfo>);
  EXPECT_EQ(sizeof(FileTypeInfo), sizeof(void*));  // nothing but its virtual functions
  EXPECT_FALSE(std::is_copy_constructible_v<FileTypeInfo>);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
