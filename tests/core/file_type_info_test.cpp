#include "file_type_info.h"

#include <gtest/gtest.h>

#include <type_traits>

#include "virtual_slot.h"

namespace Qel::Lumetra::ShellExt {
namespace {

TEST(FileTypeInfo, IsAPureInterface) {
  EXPECT_TRUE(std::is_abstract_v<FileTypeInfo>);
  EXPECT_TRUE(std::has_virtual_destructor_v<FileTypeInfo>);
  EXPECT_EQ(sizeof(FileTypeInfo), sizeof(void*));  // only the pointer to its virtual functions
  EXPECT_FALSE(std::is_copy_constructible_v<FileTypeInfo>);
}

TEST(FileTypeInfo, HasItsOperationsInOrder) {
  using Testing::VirtualSlot;
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::IsValid), 0u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::GetTypeDescription), 1u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::GetDimensions), 2u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::GetFrameCount), 3u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::GetBitDepth), 4u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::GetDataTypeName), 5u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::GetComment), 6u);
  EXPECT_EQ(VirtualSlot(&FileTypeInfo::CreateThumbnail), 7u);
}

/// Counts the destroyed objects of this class.
class Destroyed final : public FileTypeInfo {
 public:
  explicit Destroyed(int& count) : count_(count) {}
  ~Destroyed() override { ++count_; }

  bool IsValid() const override { return false; }
  std::wstring GetTypeDescription() const override { return {}; }
  Size2 GetDimensions() const override { return {}; }
  std::int32_t GetFrameCount() const override { return 0; }
  std::int32_t GetBitDepth() const override { return 0; }
  std::wstring GetDataTypeName() const override { return {}; }
  std::wstring GetComment() const override { return {}; }
  HBITMAP CreateThumbnail(const SIZE&) const override { return nullptr; }

 private:
  int& count_;
};

TEST(FileTypeInfo, HasItsDestructorLast) {
  int count = 0;
  FileTypeInfo* const info = new Destroyed(count);
  // An Itanium virtual table has two entries for a destructor. The second one also deletes the object.
  using Delete = void(FileTypeInfo*);
  // NOLINTNEXTLINE(clang-analyzer-core.uninitialized.Assign): the analyzer does not know virtual tables
  void* const* const table = *reinterpret_cast<void***>(info);
  reinterpret_cast<Delete*>(table[9])(info);
  EXPECT_EQ(count, 1);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
