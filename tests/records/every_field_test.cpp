// SPDX-License-Identifier: MIT
// One table of fields per record. From it: what a new record holds, that copies, assignments and
// moves take every field over, each changed alone, and which fields a comparison sees.
#include <gtest/gtest.h>
#include <orb/orb.h>

#include <algorithm>
#include <cstring>
#include <set>
#include <string>
#include <tuple>
#include <type_traits>
#include <utility>

#include "support/texts.h"

namespace {

template <typename Class, typename T>
struct Field {
  Field(const char* n, T Class::*m, std::type_identity_t<T> i = {})
      : name(n), member(m), initial(i) {}
  const char* name;
  T Class::*member;
  T initial;
};

template <typename Record>
struct Fields;

// A table is read by its lines.
// clang-format off
#define FIELDS(Class, ...)                                 \
  template <> struct Fields<Class> {                       \
    using Record = Class;                                  \
    static auto List() { return std::tuple{__VA_ARGS__}; } \
  }
#define F(name, ...) Field(#name, &Record::name __VA_OPT__(, ) __VA_ARGS__)

FIELDS(COrbTime, F(ticks), F(fraction)); FIELDS(COrbSize, F(width), F(height));
FIELDS(COrbPoint, F(x), F(y)); FIELDS(COrbRect, F(left), F(top), F(right), F(bottom));
FIELDS(COrbGeotagData::COrbGeotagDMS, F(degrees), F(minutes), F(seconds));
FIELDS(COrbGeotagData, F(validFlag1), F(validFlag2), F(latitude), F(longitude), F(byteValue1, 4),
       F(wideValue), F(byteValue2), F(realValue), F(byteValue3), F(geoText1), F(geoText2),
       F(shortValue1), F(shortValue2), F(geoText3), F(intValue));
FIELDS(COrbSimpleGeotagData, F(geoValue1), F(geoValue2), F(geoValue3), F(geoValue4), F(validBits));
FIELDS(COrbFocusArea, F(areaValue1), F(areaValue2), F(areaValue3), F(areaValue4), F(areaKind));
FIELDS(COrbNeutralNoiseReductionData, F(nrValue1, 1), F(nrValue2), F(nrValue3), F(nrValue4, 5),
       F(nrValue5, 5));
FIELDS(COrbImagePropertyData, F(intValue1), F(intValue2), F(intValue3), F(intValue4), F(intValue5),
       F(intValue6), F(intValue7), F(intValue8), F(intValue9), F(intValue10), F(intValue11),
       F(intValue12), F(intValue13), F(dateTime1), F(geotag), F(dateTime2), F(text1), F(intValue14),
       F(intValue15), F(longValue), F(focusAreas), F(text2), F(text3), F(text4), F(text5), F(text6),
       F(text7), F(extraFlag1), F(extraFlag2), F(extraFlag3), F(extraFlag4));
FIELDS(COrbIPTCData, F(items));
FIELDS(COrbIPTCPresetData, F(items), F(presetValue), F(presetText), F(selectedCodes));
FIELDS(COrbMultiIPTCData, F(items), F(codeSet1), F(codeSet2), F(codeSet3));
FIELDS(COrbDBMetaData, F(entries));
FIELDS(COrbOutputData, F(outputPath), F(outputText), F(outputReal, 1.0), F(outputSize),
       F(outputBlock));
FIELDS(COrbBatchData, F(batchValues), F(batchPaths), F(batchPath), F(batchTexts), F(batchReal1,
       1.0), F(batchReal2, 300.0), F(batchSize), F(batchBlock), F(batchValue), F(batchFlag));
FIELDS(COrbRenameData, F(renameValue1), F(renameValue2, 1), F(renameText1), F(renameText2),
       F(renameValue3), F(renameValue4), F(renameValue5), F(renameValue6, 1), F(renameValue7, 3),
       F(renameValue8, 1), F(renameValue9, 3), F(renameFlag1), F(renameValue10, 10),
       F(renameValue11), F(renameValue12), F(renameValue13), F(renameValue14), F(renameValue15, 10),
       F(renameValue16), F(renameValue17, 1), F(renameValue18, 3), F(renameFlag2), F(renameFlag3));
FIELDS(COrbFileCopyData, F(copyPath), F(copyText));
FIELDS(COrbOutputMSSData, F(leadingSlot), F(filePath), F(fileText));
FIELDS(COrbOutputAFNRFileData, F(leadingSlot), F(filePath), F(fileText));
FIELDS(COrbOutputMovieImageData, F(movieText), F(movieValue), F(movieInt1), F(movieInt2));
FIELDS(COrbMovieTrimData, F(trimRange));
FIELDS(COrbMovieTrimSaveData, F(trimRange), F(trimSaveValue));
FIELDS(COrbTaskPropertyData, F(taskValues), F(taskInt1), F(taskIPTC), F(taskInt2), F(taskInt3),
       F(taskInt4), F(taskGeotags), F(taskTrim), F(taskFlag1), F(taskFlag2), F(taskInt5),
       F(taskPath), F(taskText), F(taskRename), F(taskFlag3));
FIELDS(COrbSNSCommonData, F(commonValue), F(commonText1), F(commonInt), F(commonText2),
       F(commonTime1), F(commonTime2));
FIELDS(COrbSNSItemData, F(commonValue), F(commonText1), F(commonInt), F(commonText2),
       F(commonTime1), F(commonTime2), F(itemText1), F(itemText2), F(itemText3), F(itemInt1),
       F(itemInt2), F(itemInt3));
FIELDS(COrbSNSNodeData, F(commonValue), F(commonText1), F(commonInt), F(commonText2),
       F(commonTime1), F(commonTime2), F(children), F(nodeTexts), F(nodeFlag));
FIELDS(COrbSNSDataList, F(listInt), F(items), F(rootNode));
FIELDS(COrbSNSDownloadData, F(downloadInt), F(downloadPath), F(downloadValues));
FIELDS(COrbRelationData, F(relationBlock), F(relationValues1), F(relationValues2));
FIELDS(COrbSourceData, F(sourceValue1), F(sourcePath), F(sourceText), F(sourceValue2), F(sourceInt),
       F(sourceTime1), F(sourceTime2), F(sourceValue3), F(relation), F(sourceTime3));
FIELDS(COrbModuleData, F(moduleInt1), F(moduleInt2), F(moduleInt3), F(moduleText));
FIELDS(COrbWindowData, F(windowBlock)); FIELDS(COrbViewData, F(viewValue));
FIELDS(COrbFontData, F(fontValue));
FIELDS(COrbOrganizeData, F(organizeValue), F(organizeInt1), F(organizeInt2), F(organizeFlag, true));
FIELDS(COrbProfileData, F(profileInt1), F(profileInt2), F(profilePath), F(profileBuffer));
FIELDS(COrbProfileImage, F(profile), F(imageValue));
FIELDS(COrbBitmapData, F(bitmapValue), F(bitmapSize), F(bitmapPoint));
FIELDS(COrbIconData, F(bitmaps));
FIELDS(COrbFunctionData, F(functionInt1), F(functionInt2), F(functionText), F(functionInt3),
       F(functionInt4), F(icons), F(functionInt5), F(functionInt6), F(functionInt7),
       F(functionInt8));
FIELDS(COrbFolderData, F(folderBlock), F(folderPath), F(folderValues));
FIELDS(COrbNodeData, F(nodeValue1), F(nodeText), F(nodeInt1), F(nodeInt2), F(nodeValue2),
       F(nodeValues1), F(nodeValues2), F(nodeValues3));
FIELDS(COrbNameData, F(nameValue), F(nameText)); FIELDS(COrbHistogramData, F(histograms));
FIELDS(COrbUndoRedoDataList, F(undoInt), F(pathPairs));
FIELDS(COrbEditSyncData, F(syncBlock), F(syncFlag));
// clang-format on

template <typename Record>
void ForEachField(auto visit) {
  std::apply([&](const auto&... field) { (visit(field), ...); }, Fields<Record>::List());
}

template <typename T>
concept HasTable = requires {
  Fields<T>::List();
};

template <typename T>
bool Same(const T& a, const T& b) {
  if constexpr (HasTable<T>) {
    bool same = true;
    ForEachField<T>([&](const auto& f) { same = same && Same(a.*f.member, b.*f.member); });
    return same;
  } else if constexpr (std::is_same_v<T, COrbStringData>) {
    return OrbStringDataCmp(a, b) == 0;
  } else if constexpr (std::is_same_v<T, COrbFilePath>) {
    return Same(a.GetFullPath(), b.GetFullPath());
  } else if constexpr (std::is_same_v<T, COrbBuffer>) {
    return a.size == b.size && (a.size == 0 || std::memcmp(a.data, b.data, a.size) == 0) &&
           (&a == &b || a.data != b.data || a.data == nullptr);
  } else if constexpr (requires { a.begin(); }) {
    return std::ranges::equal(a, b, [](const auto& x, const auto& y) { return Same(x, y); });
  } else if constexpr (requires { a.second; }) {
    return Same(a.first, b.first) && Same(a.second, b.second);
  } else {
    return a == b;
  }
}

/// Changes a value, and every field of a record, to something that it was not before.
template <typename T>
void Poke(T& value) {
  static int count = 0;
  count = count % 50 + 1;
  const auto poked = [](auto v) { return Poke(v), v; };
  if constexpr (HasTable<T>) {
    ForEachField<T>([&](const auto& f) { Poke(value.*f.member); });
  } else if constexpr (std::is_same_v<T, COrbStringData>) {
    value = S("text " + std::to_string(count));
  } else if constexpr (std::is_same_v<T, COrbFilePath>) {
    const COrbStringData path = poked(COrbStringData());
    value.Initialize(&path);
  } else if constexpr (std::is_same_v<T, COrbBuffer>) {
    std::memset(value.Allocate(100), count, 100);
  } else if constexpr (requires { value.emplace_back(); }) {
    value.emplace_back();
    if constexpr (!std::is_same_v<typename T::value_type, COrbSNSNodeData>) Poke(value.back());
  } else if constexpr (requires { typename T::mapped_type; }) {
    Poke(value[poked(typename T::key_type())]);
  } else if constexpr (requires { typename T::key_type; }) {
    value.insert(poked(typename T::key_type()));
  } else if constexpr (requires { value.fill(0); }) {
    value.fill(static_cast<typename T::value_type>(value[0] + count));
  } else if constexpr (requires { value.second; }) {
    Poke(value.first), Poke(value.second);
  } else if constexpr (std::is_same_v<T, bool>) {
    value = !value;
  } else {
    value = static_cast<T>(value + static_cast<T>(count));
  }
}

/// Whether a name is one of those in a list, separated by spaces.
bool IsIn(const std::string& names, const std::string& name) {
  return (" " + names + " ").find(" " + name + " ") != std::string::npos;
}

/// The fields follow each other in the table's order and fill the object, so none is missing there.
template <typename Record>
void CheckTable() {
  constexpr bool kHasPrivateFields = std::is_same_v<Record, COrbImagePropertyData>;
  const Record record;
  const auto up = [](std::size_t n, std::size_t align) { return (n + align - 1) / align * align; };
  std::size_t end = std::is_polymorphic_v<Record> ? sizeof(void*) : 0;
  ForEachField<Record>([&](const auto& f) {
    const auto* field = &(record.*f.member);
    EXPECT_TRUE(Same(*field, f.initial)) << f.name;
    end = up(end, alignof(decltype(f.initial)));
    const void* expected = reinterpret_cast<const char*>(&record) + end;
    EXPECT_TRUE(kHasPrivateFields || field == expected) << f.name;
    end += sizeof(*field);
  });
  EXPECT_TRUE(kHasPrivateFields || sizeof(Record) == up(end, alignof(Record)));
}

/// Each field is as in `expected`, those in `others` as in `other`.
template <typename T>
void ExpectFields(const T& actual, const T& expected, const std::string& others, const T& other) {
  ForEachField<T>([&](const auto& f) {
    const T& source = IsIn(others, f.name) ? other : expected;
    EXPECT_TRUE(Same(actual.*f.member, source.*f.member)) << f.name;
  });
}

/// A copy has the fields in `fresh` as a new record has them.
template <typename Record>
void CheckCopies(const std::string& fresh = "") {
  ForEachField<Record>([&](const auto& f) {
    SCOPED_TRACE(f.name);
    Record source;
    Poke(source.*f.member);
    const Record copy(source);
    ExpectFields(copy, source, fresh, Record());
    ExpectFields(Record(std::move(source)), copy, "", copy);
  });
}

/// Assignment leaves the fields in `kept` as they are.
template <typename Record>
void CheckAssignments(const std::string& kept = "") {
  ForEachField<Record>([&](const auto& f) {
    SCOPED_TRACE(f.name);
    Record source, target, fresh;
    Poke(source.*f.member);
    Poke(target);
    const Record old(target);
    target = source;
    EXPECT_EQ(&(target = std::as_const(target)), &target);
    ExpectFields(target, source, kept, old);
    fresh = std::move(source);
    ExpectFields(fresh, target, kept, Record());
  });
}

template <typename Record>
void Check(const std::string& notCopied = "", const std::string& notAssigned = "") {
  CheckTable<Record>();
  CheckCopies<Record>(notCopied);
  CheckAssignments<Record>(notAssigned);
}

template <typename... Records>
void CheckPlain() {
  (Check<Records>(), ...);
}

TEST(EveryField, IsCopiedAssignedAndMoved) {
  // clang-format off
  CheckPlain<
      COrbSize, COrbPoint, COrbRect, COrbGeotagData::COrbGeotagDMS, COrbGeotagData,
      COrbSimpleGeotagData, COrbFocusArea, COrbNeutralNoiseReductionData, COrbImagePropertyData,
      COrbIPTCData, COrbIPTCPresetData, COrbMultiIPTCData, COrbDBMetaData, COrbOutputData,
      COrbRenameData, COrbFileCopyData, COrbOutputMSSData, COrbOutputAFNRFileData,
      COrbOutputMovieImageData, COrbMovieTrimData, COrbSNSCommonData, COrbSNSDownloadData,
      COrbRelationData, COrbSourceData, COrbModuleData, COrbWindowData, COrbViewData, COrbFontData,
      COrbOrganizeData, COrbProfileData, COrbProfileImage, COrbBitmapData, COrbIconData,
      COrbFolderData, COrbNodeData, COrbNameData, COrbHistogramData, COrbUndoRedoDataList,
      COrbEditSyncData>();
  // clang-format on
}

TEST(EveryField, ButThoseWithARuleOfTheirOwnIsCopiedAndAssigned) {
  const char common[] = "commonValue commonText1 commonInt commonText2 commonTime1 commonTime2";
  Check<COrbBatchData>("batchFlag");
  Check<COrbMovieTrimSaveData>("trimRange");
  Check<COrbFunctionData>("", "icons functionInt5");
  Check<COrbSNSItemData>("", common);
  Check<COrbSNSNodeData>("", common);
  CheckTable<COrbSNSDataList>();
  CheckCopies<COrbSNSDataList>();
  CheckTable<COrbTaskPropertyData>();
  CheckAssignments<COrbTaskPropertyData>();
}

template <typename Record>
void CheckComparison(const std::string& ignored = "") {
  ForEachField<Record>([&](const auto& f) {
    Record poked;
    Poke(poked.*f.member);
    EXPECT_EQ(poked == Record(), IsIn(ignored, f.name)) << f.name;
    EXPECT_NE(poked != Record(), IsIn(ignored, f.name)) << f.name;
    EXPECT_TRUE(poked == Record(poked)) << f.name;
  });
}

TEST(EveryField, ThatCountsIsCompared) {
  CheckComparison<COrbRect>();
  CheckComparison<COrbGeotagData::COrbGeotagDMS>();
  CheckComparison<COrbSimpleGeotagData>();
  CheckComparison<COrbNeutralNoiseReductionData>();
  CheckComparison<COrbImagePropertyData>("intValue11 intValue12 intValue13");
  CheckComparison<COrbGeotagData>(
      "byteValue1 wideValue byteValue2 geoText1 geoText2 shortValue1 "
      "shortValue2 geoText3 intValue");
}

}  // namespace
