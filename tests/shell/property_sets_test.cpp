// Tests the property sets and their enumerators.
#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>

#include <cstring>
#include <filesystem>
#include <string>
#include <vector>

#include "mrc_file.h"
#include "raw_file.h"
#include "server_dll.h"
#include "shell_values.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr HRESULT kNotSupported = static_cast<HRESULT>(0x80070032);

PROPSPEC ById(PROPID id) {
  PROPSPEC specifier{};
  specifier.ulKind = PRSPEC_PROPID;
  specifier.propid = id;
  return specifier;
}

class PropertySet : public ServerTest {
 protected:
  using Sets = ComPtr<IPropertySetStorage>;
  using Storage = ComPtr<IPropertyStorage>;
  using Properties = ComPtr<IEnumSTATPROPSTG>;
  using SetList = ComPtr<IEnumSTATPROPSETSTG>;

  Sets Make() { return dll_.CreateInstance<IPropertySetStorage>(kShellExtClass, IID_IPropertySetStorage); }

  static void Load(const Sets& object, const std::filesystem::path& file) {
    EXPECT_EQ(As<IPersistFile>(object, IID_IPersistFile)->Load(file.c_str(), STGM_READ), S_OK);
  }

  /// Returns the property sets of a file with a comment of two lines.
  Sets MakeLoaded() {
    Sets sets = Make();
    Load(sets,
         folder_.Write(L"stack.mrc",
                       MrcFile{.nx = 512, .ny = 256, .nz = 61, .mode = 1, .labels = {"one", "two"}}.Bytes()));
    return sets;
  }

  static Storage Open(const Sets& sets, const FMTID& set) {
    Storage storage;
    EXPECT_EQ(sets->Open(set, STGM_READ | STGM_SHARE_EXCLUSIVE, storage.Put()), S_OK);
    return storage;
  }

  static SetList ListSets(const Sets& sets) {
    SetList list;
    EXPECT_EQ(sets->Enum(list.Put()), S_OK);
    return list;
  }

  static Properties ListProperties(const Storage& storage) {
    Properties list;
    EXPECT_EQ(storage->Enum(list.Put()), S_OK);
    return list;
  }

  static Value Read(const Storage& storage, PROPID id) {
    const PROPSPEC specifier = ById(id);
    PROPVARIANT value{};
    EXPECT_EQ(storage->ReadMultiple(1, &specifier, &value), S_OK);
    return TakeValue(value);
  }

  /// Returns the ids that the enumerator has not returned yet.
  static std::vector<PROPID> Ids(const Properties& list) {
    std::vector<PROPID> ids;
    STATPROPSTG element{};
    for (ULONG fetched = 0; list->Next(1, &element, &fetched) == S_OK;) ids.push_back(element.propid);
    return ids;
  }

  static std::vector<FMTID> Ids(const SetList& list) {
    std::vector<FMTID> ids;
    STATPROPSETSTG element{};
    for (ULONG fetched = 0; list->Next(1, &element, &fetched) == S_OK;) ids.push_back(element.fmtid);
    return ids;
  }

  TempFolder folder_;
};

const std::vector<PROPID> kImageIds = {3, 4, 7, 12, 13};

TEST_F(PropertySet, OfImageSummaryHasFiveProperties) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  EXPECT_EQ(Read(storage, 3), Number(VT_INT, 512));
  EXPECT_EQ(Read(storage, 4), Number(VT_INT, 256));
  EXPECT_EQ(Read(storage, 7), Number(VT_INT, 16));
  EXPECT_EQ(Read(storage, 12), Number(VT_INT, 61));
  EXPECT_EQ(Read(storage, 13), Text(VT_BSTR, L"512 x 256"));
}

TEST_F(PropertySet, GivesNegativeNumbersUnchanged) {
  const Sets sets = Make();
  Load(sets, folder_.Write(L"negative.raw", RawFile{.width = -2}.Bytes()));
  EXPECT_EQ(Read(Open(sets, kImageSummary), 3), Number(VT_INT, -2));
}

TEST_F(PropertySet, OfSummaryHasTheComment) {
  EXPECT_EQ(Read(Open(MakeLoaded(), kSummary), 6), Text(VT_BSTR, L"one\r\ntwo"));
}

TEST_F(PropertySet, HasAnEmptyCommentForAFileWithoutOne) {
  const Sets sets = Make();
  Load(sets, folder_.Write(L"image.mrc", MrcFile{}.Bytes()));
  EXPECT_EQ(Read(Open(sets, kSummary), 6), Text(VT_BSTR, L""));
}

TEST_F(PropertySet, IsTheSameObjectAtEveryOpen) {
  const Sets sets = MakeLoaded();
  for (const FMTID& set : {kSummary, kImageSummary}) {
    const Storage first = Open(sets, set);
    const Storage second = Open(sets, set);
    EXPECT_EQ(first.Get(), second.Get());
    EXPECT_EQ(As<IUnknown>(first, IID_IUnknown).Get(), As<IUnknown>(second, IID_IUnknown).Get());
  }
  EXPECT_NE(Open(sets, kSummary).Get(), Open(sets, kImageSummary).Get());
}

TEST_F(PropertySet, CanBeOpenedInEveryMode) {
  const Sets sets = MakeLoaded();
  for (const DWORD mode : {DWORD{0}, DWORD{STGM_READWRITE | STGM_SHARE_EXCLUSIVE}, DWORD{0xFFFFFFFF}}) {
    Storage storage;
    EXPECT_EQ(sets->Open(kSummary, mode, storage.Put()), S_OK);
  }
}

TEST_F(PropertySet, HasNoOtherInterface) {
  const Storage storage = Open(MakeLoaded(), kSummary);
  EXPECT_EQ(As<IUnknown>(storage, IID_IPropertyStorage).Get(), storage.Get());
  for (const IID& iid : {IID_IPropertySetStorage, IID_IEnumSTATPROPSTG, IID_IPersist}) {
    void* answer = &answer;
    EXPECT_EQ(storage->QueryInterface(iid, &answer), E_NOINTERFACE);
    EXPECT_EQ(answer, nullptr);
  }
}

TEST_F(PropertySet, OutlivesItsFile) {
  Storage storage;
  {
    const Sets sets = MakeLoaded();
    storage = Open(sets, kImageSummary);
  }
  EXPECT_EQ(dll_.CanUnloadNow(), S_FALSE);
  EXPECT_EQ(Read(storage, 3), Number(VT_INT, 512));
}

TEST_F(PropertySet, NeedsAValidFile) {
  const Sets invalid = Make();
  Load(invalid, folder_.Write(L"image.mrc", MrcFile{.nx = 0}.Bytes()));
  const Sets unknown = Make();
  Load(unknown, folder_.Write(L"image.tif", MrcFile{}.Bytes()));
  for (const Sets& sets : {Make(), invalid, unknown}) {
    for (const FMTID& set : {kSummary, kImageSummary, kOtherSet}) {
      Storage storage;
      EXPECT_EQ(sets->Open(set, STGM_READ, storage.Put()), E_FAIL);
      EXPECT_EQ(sets->Open(set, STGM_READ, nullptr), E_FAIL);
      EXPECT_FALSE(storage);
    }
    SetList list;
    EXPECT_EQ(sets->Enum(list.Put()), E_FAIL);
    EXPECT_FALSE(list);
  }
}

TEST_F(PropertySet, IsNotFoundByAnotherFormatId) {
  const Sets sets = MakeLoaded();
  FMTID lastByteOff = kSummary;
  lastByteOff.Data4[7] ^= 1;
  for (const FMTID& set : {kOtherSet, lastByteOff, FMTID{}}) {
    Storage storage;
    EXPECT_EQ(sets->Open(set, STGM_READ, storage.Put()), STG_E_FILENOTFOUND);
    EXPECT_EQ(sets->Open(set, STGM_READ, nullptr), STG_E_FILENOTFOUND);
    EXPECT_FALSE(storage);
  }
}

TEST_F(PropertySet, NeedsAnOutputPointer) {
  const Sets sets = MakeLoaded();
  EXPECT_EQ(sets->Open(kSummary, STGM_READ, nullptr), E_POINTER);
  EXPECT_EQ(sets->Enum(nullptr), E_POINTER);
  EXPECT_EQ(Open(sets, kSummary)->Enum(nullptr), E_POINTER);
  EXPECT_EQ(ListSets(sets)->Clone(nullptr), E_POINTER);
}

TEST_F(PropertySet, CannotBeCreatedOrDeleted) {
  for (const Sets& sets : {Make(), MakeLoaded()}) {
    Storage storage;
    EXPECT_EQ(sets->Create(kOtherSet, nullptr, PROPSETFLAG_DEFAULT, STGM_CREATE, storage.Put()),
              STG_E_ACCESSDENIED);
    EXPECT_FALSE(storage);
    EXPECT_EQ(sets->Create(kSummary, nullptr, PROPSETFLAG_DEFAULT, STGM_CREATE, nullptr), STG_E_ACCESSDENIED);
    EXPECT_EQ(sets->Delete(kSummary), STG_E_ACCESSDENIED);
    EXPECT_EQ(sets->Delete(kOtherSet), STG_E_ACCESSDENIED);
  }
}

TEST_F(PropertySet, RefusesEveryChangeNameAndStatistic) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  const PROPSPEC specifier = ById(3);
  const PROPID id = 3;
  const PROPVARIANT value{};
  wchar_t text[] = L"name";
  LPOLESTR name = text;
  const FILETIME time{};
  STATPROPSETSTG statistics{};
  EXPECT_EQ(storage->WriteMultiple(1, &specifier, &value, PID_FIRST_USABLE), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->DeleteMultiple(1, &specifier), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->ReadPropertyNames(1, &id, &name), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->WritePropertyNames(1, &id, &name), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->DeletePropertyNames(1, &id), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->Commit(STGC_DEFAULT), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->Revert(), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->SetTimes(&time, &time, &time), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->SetClass(kShellExtClass), STG_E_ACCESSDENIED);
  EXPECT_EQ(storage->Stat(&statistics), STG_E_ACCESSDENIED);
  EXPECT_EQ(name, text);
  EXPECT_EQ(Read(storage, 3), Number(VT_INT, 512));
  EXPECT_EQ(Ids(ListProperties(storage)), kImageIds);
}

TEST_F(PropertySet, ReadsSeveralPropertiesInTheRequestedOrder) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  const PROPSPEC specifiers[] = {ById(13), ById(3), ById(3), ById(12)};
  PROPVARIANT values[4] = {};
  EXPECT_EQ(storage->ReadMultiple(4, specifiers, values), S_OK);
  EXPECT_EQ(TakeValue(values[0]), Text(VT_BSTR, L"512 x 256"));
  EXPECT_EQ(TakeValue(values[1]), Number(VT_INT, 512));
  EXPECT_EQ(TakeValue(values[2]), Number(VT_INT, 512));
  EXPECT_EQ(TakeValue(values[3]), Number(VT_INT, 61));
}

TEST_F(PropertySet, GivesCopies) {
  const Storage storage = Open(MakeLoaded(), kSummary);
  const PROPSPEC specifier = ById(6);
  PROPVARIANT value{};
  EXPECT_EQ(storage->ReadMultiple(1, &specifier, &value), S_OK);
  value.bstrVal[0] = L'X';
  EXPECT_EQ(TakeValue(value), Text(VT_BSTR, L"Xne\r\ntwo"));
  EXPECT_EQ(Read(storage, 6), Text(VT_BSTR, L"one\r\ntwo"));
}

TEST_F(PropertySet, StopsAtAMissingProperty) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  const PROPSPEC specifiers[] = {ById(3), ById(9), ById(4)};
  PROPVARIANT values[3] = {};
  EXPECT_EQ(storage->ReadMultiple(3, specifiers, values), kNotSupported);
  EXPECT_EQ(TakeValue(values[0]), Number(VT_INT, 512));
  EXPECT_EQ(TakeValue(values[1]), Value());
  EXPECT_EQ(TakeValue(values[2]), Value());
}

TEST_F(PropertySet, HasNoOtherProperties) {
  const Sets sets = MakeLoaded();
  for (const PROPID id : {0u, 1u, 2u, 5u, 6u, 8u, 9u, 14u, 0x80000003u}) {
    const PROPSPEC specifier = ById(id);
    PROPVARIANT value{};
    EXPECT_EQ(Open(sets, kImageSummary)->ReadMultiple(1, &specifier, &value), kNotSupported) << id;
  }
  for (const PROPID id : {0u, 2u, 3u, 5u, 7u, 13u}) {
    const PROPSPEC specifier = ById(id);
    PROPVARIANT value{};
    EXPECT_EQ(Open(sets, kSummary)->ReadMultiple(1, &specifier, &value), kNotSupported) << id;
  }
}

TEST_F(PropertySet, AcceptsIdsOnly) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  wchar_t name[] = L"Width";
  PROPSPEC byName{};
  byName.ulKind = PRSPEC_LPWSTR;
  byName.lpwstr = name;
  PROPVARIANT values[2] = {};
  EXPECT_EQ(storage->ReadMultiple(1, &byName, values), STG_E_INVALIDPARAMETER);
  EXPECT_EQ(storage->ReadMultiple(1, &byName, nullptr), STG_E_INVALIDPARAMETER);
  const PROPSPEC both[] = {ById(4), byName};
  EXPECT_EQ(storage->ReadMultiple(2, both, values), STG_E_INVALIDPARAMETER);
  EXPECT_EQ(TakeValue(values[0]), Number(VT_INT, 256));
  PROPSPEC neither = ById(3);
  neither.ulKind = 2;
  EXPECT_EQ(storage->ReadMultiple(1, &neither, values), STG_E_INVALIDPARAMETER);
}

TEST_F(PropertySet, ReturnsSFalseForAnEmptyRequest) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  EXPECT_EQ(storage->ReadMultiple(0, nullptr, nullptr), S_FALSE);
}

TEST_F(PropertySet, NeedsAnOutputPointerForAValueThatExists) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  const PROPSPEC existing = ById(3);
  const PROPSPEC missing = ById(9);
  EXPECT_EQ(storage->ReadMultiple(1, &existing, nullptr), E_POINTER);
  EXPECT_EQ(storage->ReadMultiple(1, &missing, nullptr), kNotSupported);
  EXPECT_EQ(storage->ReadMultiple(1, nullptr, nullptr), E_POINTER);
}

TEST_F(PropertySet, IsBuiltOncePerLoad) {
  const Sets sets = MakeLoaded();
  const Storage before = Open(sets, kImageSummary);
  // The stream is still open on the first file, so the second Load fails and there are no property sets.
  Load(sets, folder_.Write(L"second.mrc", MrcFile{}.Bytes()));
  Storage after;
  EXPECT_EQ(sets->Open(kImageSummary, STGM_READ, after.Put()), E_FAIL);
  EXPECT_EQ(Read(before, 3), Number(VT_INT, 512));
}

TEST_F(PropertySet, HoldsNoReferenceToItsObject) {
  const Sets sets = MakeLoaded();
  const ULONG before = References(sets);
  {
    const Storage storage = Open(sets, kSummary);
    const SetList list = ListSets(sets);
    const Properties properties = ListProperties(storage);
  }
  EXPECT_EQ(References(sets), before);
}

TEST_F(PropertySet, IsListedInAscendingOrder) {
  const auto ids = Ids(ListSets(MakeLoaded()));
  ASSERT_EQ(ids.size(), 2u);
  EXPECT_EQ(ids[0], kImageSummary);
  EXPECT_EQ(ids[1], kSummary);
}

TEST_F(PropertySet, IsListedWithItsFormatIdOnlyAndAnUnchangedSystemVersion) {
  const SetList list = ListSets(MakeLoaded());
  STATPROPSETSTG elements[2];
  std::memset(elements, 0x5A, sizeof elements);
  ULONG fetched = 0;
  EXPECT_EQ(list->Next(2, elements, &fetched), S_OK);
  for (const STATPROPSETSTG& element : elements) {
    EXPECT_EQ(element.clsid, CLSID{});
    EXPECT_EQ(element.grfFlags, 0u);
    for (const FILETIME& time : {element.mtime, element.ctime, element.atime}) {
      EXPECT_EQ(time.dwLowDateTime, 0u);
      EXPECT_EQ(time.dwHighDateTime, 0u);
    }
    EXPECT_EQ(element.dwOSVersion, 0x5A5A5A5Au);
  }
}

TEST_F(PropertySet, ListsItsPropertiesWithoutNames) {
  const Properties list = ListProperties(Open(MakeLoaded(), kImageSummary));
  STATPROPSTG elements[5];
  std::memset(elements, 0x5A, sizeof elements);
  ULONG fetched = 77;
  EXPECT_EQ(list->Next(5, elements, &fetched), S_OK);
  EXPECT_EQ(fetched, 5u);
  for (std::size_t i = 0; i < 5; ++i) {
    EXPECT_EQ(elements[i].lpwstrName, nullptr);
    EXPECT_EQ(elements[i].propid, kImageIds[i]);
    EXPECT_EQ(elements[i].vt, i < 4 ? VT_INT : VT_BSTR);
  }
}

TEST_F(PropertySet, ListsTheCommentAsAString) {
  const Properties list = ListProperties(Open(MakeLoaded(), kSummary));
  STATPROPSTG elements[2] = {};
  ULONG fetched = 77;
  EXPECT_EQ(list->Next(2, elements, &fetched), S_FALSE);
  EXPECT_EQ(fetched, 1u);
  EXPECT_EQ(elements[0].propid, 6u);
  EXPECT_EQ(elements[0].vt, VT_BSTR);
}

// The enumerator of properties is tested completely, the one of sets briefly: both have the same
// implementation.

TEST_F(PropertySet, NextReturnsAsManyAsThereAre) {
  const Properties list = ListProperties(Open(MakeLoaded(), kImageSummary));
  STATPROPSTG elements[9] = {};
  ULONG fetched = 77;
  EXPECT_EQ(list->Next(0, elements, &fetched), S_OK);
  EXPECT_EQ(fetched, 0u);
  EXPECT_EQ(list->Next(0, nullptr, &fetched), S_OK);
  EXPECT_EQ(list->Next(1, nullptr, &fetched), E_POINTER);
  EXPECT_EQ(fetched, 0u);
  EXPECT_EQ(list->Next(2, elements, &fetched), S_OK);
  EXPECT_EQ(fetched, 2u);
  EXPECT_EQ(elements[1].propid, 4u);
  elements[3].propid = 99;
  EXPECT_EQ(list->Next(9, elements, &fetched), S_FALSE);
  EXPECT_EQ(fetched, 3u);
  EXPECT_EQ(elements[2].propid, 13u);
  EXPECT_EQ(elements[3].propid, 99u);
  EXPECT_EQ(list->Next(1, elements, &fetched), S_FALSE);
  EXPECT_EQ(fetched, 0u);
  EXPECT_EQ(list->Next(0, elements, &fetched), S_OK);
}

TEST_F(PropertySet, NextNeedsNoArrayAtTheEnd) {
  const Properties list = ListProperties(Open(MakeLoaded(), kSummary));
  ULONG fetched = 7;
  EXPECT_EQ(list->Skip(1), S_FALSE);
  EXPECT_EQ(list->Next(1, nullptr, &fetched), S_FALSE);
  EXPECT_EQ(fetched, 0u);
}

TEST_F(PropertySet, SkipGoesToTheEnd) {
  const Properties list = ListProperties(Open(MakeLoaded(), kImageSummary));
  EXPECT_EQ(list->Skip(0), S_OK);
  STATPROPSTG element{};
  ULONG fetched = 77;
  EXPECT_EQ(list->Next(1, &element, &fetched), S_OK);
  EXPECT_EQ(element.propid, 3u);
  EXPECT_EQ(list->Skip(1), S_FALSE);
  EXPECT_EQ(list->Next(1, &element, &fetched), S_FALSE);
  EXPECT_EQ(fetched, 0u);
  EXPECT_EQ(list->Skip(1), S_FALSE);
  EXPECT_EQ(list->Skip(0), S_OK);
  EXPECT_EQ(list->Reset(), S_OK);
  EXPECT_EQ(Ids(list), kImageIds);
}

TEST_F(PropertySet, CloneBeginsAtTheFirst) {
  const Properties list = ListProperties(Open(MakeLoaded(), kImageSummary));
  list->Skip(1);
  Properties clone;
  EXPECT_EQ(list->Clone(clone.Put()), S_OK);
  EXPECT_EQ(Ids(clone), kImageIds);
  EXPECT_TRUE(Ids(list).empty());
}

TEST_F(PropertySet, EnumeratorOfSetsSkipsResetsAndClonesInTheSameWay) {
  const SetList list = ListSets(MakeLoaded());
  STATPROPSETSTG elements[3] = {};
  ULONG fetched = 77;
  EXPECT_EQ(list->Next(0, elements, &fetched), S_OK);
  EXPECT_EQ(fetched, 0u);
  EXPECT_EQ(list->Next(3, elements, &fetched), S_FALSE);
  EXPECT_EQ(fetched, 2u);
  SetList clone;
  EXPECT_EQ(list->Clone(clone.Put()), S_OK);
  EXPECT_EQ(Ids(clone).size(), 2u);
  EXPECT_EQ(clone->Reset(), S_OK);
  EXPECT_EQ(clone->Skip(0), S_OK);
  EXPECT_EQ(clone->Skip(1), S_FALSE);
  EXPECT_TRUE(Ids(clone).empty());
}

TEST_F(PropertySet, EnumeratorsHaveIndependentPositions) {
  const Storage storage = Open(MakeLoaded(), kImageSummary);
  const Properties first = ListProperties(storage);
  const Properties second = ListProperties(storage);
  EXPECT_NE(first.Get(), second.Get());
  first->Skip(1);
  EXPECT_EQ(Ids(second), kImageIds);
}

TEST_F(PropertySet, EnumeratorsOutliveWhatTheyList) {
  Properties properties;
  SetList list;
  {
    const Sets sets = MakeLoaded();
    properties = ListProperties(Open(sets, kImageSummary));
    list = ListSets(sets);
  }
  EXPECT_EQ(dll_.CanUnloadNow(), S_FALSE);
  EXPECT_EQ(Ids(properties), kImageIds);
  EXPECT_EQ(Ids(list).size(), 2u);
  SetList clone;
  EXPECT_EQ(list->Clone(clone.Put()), S_OK);
  EXPECT_EQ(Ids(clone).size(), 2u);
}

TEST_F(PropertySet, EnumeratorsStayCompleteWhenAnotherFileIsLoaded) {
  const Sets sets = MakeLoaded();
  const SetList list = ListSets(sets);
  STATPROPSETSTG element{};
  ULONG fetched = 0;
  EXPECT_EQ(list->Next(1, &element, &fetched), S_OK);
  Load(sets, folder_.Write(L"second.mrc", MrcFile{}.Bytes()));
  EXPECT_EQ(list->Next(1, &element, &fetched), S_OK);
  EXPECT_EQ(element.fmtid, kSummary);
  EXPECT_EQ(list->Reset(), S_OK);
  EXPECT_EQ(Ids(list).size(), 2u);
}

TEST_F(PropertySet, EnumeratorsHaveTheirOwnInterfaceOnly) {
  const Sets sets = MakeLoaded();
  const SetList list = ListSets(sets);
  const Properties properties = ListProperties(Open(sets, kSummary));
  EXPECT_EQ(As<IUnknown>(list, IID_IEnumSTATPROPSETSTG).Get(), list.Get());
  EXPECT_EQ(As<IUnknown>(properties, IID_IEnumSTATPROPSTG).Get(), properties.Get());
  void* answer = &answer;
  EXPECT_EQ(list->QueryInterface(IID_IEnumSTATPROPSTG, &answer), E_NOINTERFACE);
  EXPECT_EQ(properties->QueryInterface(IID_IEnumSTATPROPSETSTG, &answer), E_NOINTERFACE);
}

using PropertySetDeathTest = PropertySet;

TEST_F(PropertySetDeathTest, NextAlwaysWritesItsCount) {
  const Properties list = ListProperties(Open(MakeLoaded(), kImageSummary));
  const auto isAccessViolation = [](int status) {
    return static_cast<DWORD>(status) == EXCEPTION_ACCESS_VIOLATION;
  };
  STATPROPSTG element{};
  EXPECT_EXIT(list->Next(1, &element, nullptr), isAccessViolation, "");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
