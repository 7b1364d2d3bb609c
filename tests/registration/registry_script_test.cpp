#include "registry_script.h"

#include <gtest/gtest.h>

#include <string>

namespace Qel::Lumetra::ShellExt {
namespace {

std::optional<RegistryScript> Parse(std::string_view text, std::vector<Replacement> replacements = {}) {
  return ParseRegistryScript(text, replacements);
}

/// Returns the key of a script that has exactly one.
ScriptKey ParseKey(std::string_view line, std::vector<Replacement> replacements = {}) {
  const auto script = Parse("HKCR { " + std::string(line) + " }", std::move(replacements));
  if (!script || script->size() != 1) {
    ADD_FAILURE() << "not exactly one key: " << line;
    return {};
  }
  return script->front();
}

bool Refuses(std::string_view text) {
  return !Parse(text).has_value();
}

/// Returns whether `line` is refused as a line of an otherwise valid block.
bool RefusesLine(std::string_view line) {
  return Refuses("HKCR { Around { " + std::string(line) + " } }");
}

const RegistryData kText = std::wstring(L"text");

TEST(RegistryScript, KeepsKeysInTheOrderOfTheTextWithTheirDepth) {
  const auto script = Parse("HKCR { A { B { C } D } E } HKLM { F } HKCR { G }");
  ASSERT_TRUE(script);
  ASSERT_EQ(script->size(), 7u);
  const std::vector<std::pair<std::wstring, std::size_t>> expected = {
      {L"A", 0}, {L"B", 1}, {L"C", 2}, {L"D", 1}, {L"E", 0}, {L"F", 0}, {L"G", 0}};
  for (std::size_t i = 0; i < expected.size(); ++i) {
    EXPECT_EQ((*script)[i].name, expected[i].first);
    EXPECT_EQ((*script)[i].depth, expected[i].second);
    EXPECT_EQ((*script)[i].root, i == 5 ? RegistryRoot::kLocalMachine : RegistryRoot::kClassesRoot);
  }
}

TEST(RegistryScript, AnEmptyScriptHasNoKeys) {
  EXPECT_EQ(Parse("")->size(), 0u);
  EXPECT_EQ(Parse(" \t\r\n")->size(), 0u);
  EXPECT_EQ(Parse("HKLM {}")->size(), 0u);
}

TEST(RegistryScript, ReadsTheMarkOfAKey) {
  EXPECT_EQ(ParseKey("A").mark, KeyMark::kNone);
  EXPECT_EQ(ParseKey("ForceRemove A").mark, KeyMark::kForceRemove);
  EXPECT_EQ(ParseKey("NoRemove A").mark, KeyMark::kNoRemove);
}

TEST(RegistryScript, RecognisesKeywordsAndRootsWhateverTheirCase) {
  const auto script = Parse("hklm { FORCEremove A = S 'text' { VAL B = D '7' } }");
  ASSERT_TRUE(script);
  EXPECT_EQ(script->front().root, RegistryRoot::kLocalMachine);
  EXPECT_EQ(script->front().mark, KeyMark::kForceRemove);
  EXPECT_EQ(script->front().defaultValue, kText);
  EXPECT_EQ(script->front().values.at(0).data, RegistryData(7u));
}

TEST(RegistryScript, AQuotedWordIsNeverAKeyword) {
  EXPECT_EQ(ParseKey("'ForceRemove'").name, L"ForceRemove");
  EXPECT_EQ(ParseKey("NoRemove 'NoRemove'").name, L"NoRemove");
  EXPECT_EQ(ParseKey("'val' = s 'text'").defaultValue, kText);
  EXPECT_TRUE(Refuses("'HKCR' { }"));
  EXPECT_TRUE(RefusesLine("A = 's' 'text'"));
}

TEST(RegistryScript, ReadsDefaultAndNamedValues) {
  const ScriptKey key = ParseKey("A = s 'text' { val B = s bare val 'C c' = d '1' val D = d 4294967295 }");
  EXPECT_EQ(key.defaultValue, kText);
  ASSERT_EQ(key.values.size(), 3u);
  EXPECT_EQ(key.values[0].name, L"B");
  EXPECT_EQ(key.values[0].data, RegistryData(std::wstring(L"bare")));
  EXPECT_EQ(key.values[1].name, L"C c");
  EXPECT_EQ(key.values[1].data, RegistryData(1u));
  EXPECT_EQ(key.values[2].data, RegistryData(4294967295u));
  EXPECT_FALSE(ParseKey("A").defaultValue);
}

TEST(RegistryScript, AValueAfterASubkeyBelongsToTheKeyAroundBoth) {
  const auto script = Parse("HKCR { A { B { val C = d 1 } val D = d 2 } }");
  ASSERT_TRUE(script);
  EXPECT_EQ((*script)[0].values.at(0).name, L"D");
  EXPECT_EQ((*script)[1].values.at(0).name, L"C");
}

TEST(RegistryScript, QuotesAdmitEveryPrintableCharacter) {
  EXPECT_EQ(ParseKey("'Shell Extensions'").name, L"Shell Extensions");
  EXPECT_EQ(ParseKey("'.ebn'").name, L".ebn");
  EXPECT_EQ(ParseKey("'{79E6}'").name, L"{79E6}");
  EXPECT_EQ(ParseKey("'a=b'").name, L"a=b");
  EXPECT_EQ(ParseKey("A = s 'C:\\x y\\z'").defaultValue, RegistryData(std::wstring(L"C:\\x y\\z")));
}

TEST(RegistryScript, ADoubledQuoteIsOneQuote) {
  EXPECT_EQ(ParseKey("'it''s'").name, L"it's");
  EXPECT_EQ(ParseKey("A = s ''''").defaultValue, RegistryData(std::wstring(L"'")));
  EXPECT_EQ(ParseKey("A = s ''").defaultValue, RegistryData(std::wstring()));
}

TEST(RegistryScript, NeedsNoWhiteSpaceAroundPunctuation) {
  const auto tight = Parse("HKCR{A=s'text'{val B=d'1'}C}");
  ASSERT_TRUE(tight);
  EXPECT_EQ(tight->size(), 2u);
  EXPECT_EQ(tight->front().values.at(0).data, RegistryData(1u));
}

TEST(RegistryScript, InsertsReplacementsIntoNamesAndStrings) {
  const std::vector<Replacement> replacements = {{L"APPID", L"{66A6}"}, {L"Module", L"C:\\it''s.dll"}};
  EXPECT_EQ(ParseKey("'%APPID%'", replacements).name, L"{66A6}");
  EXPECT_EQ(ParseKey("'x%APPID%%appid%y'", replacements).name, L"x{66A6}{66A6}y");
  EXPECT_EQ(ParseKey("A = s '%MODULE%'", replacements).defaultValue,
            RegistryData(std::wstring(L"C:\\it's.dll")));
}

TEST(RegistryScript, TheFirstOfTwoReplacementsOfOneNameCounts) {
  EXPECT_EQ(ParseKey("'%a%'", {{L"A", L"first"}, {L"a", L"second"}}).name, L"first");
}

TEST(RegistryScript, DoesNotSearchAReplacementAgain) {
  EXPECT_EQ(ParseKey("A = s '%M%'", {{L"M", L"100%M%"}}).defaultValue, RegistryData(std::wstring(L"100%M%")));
}

TEST(RegistryScript, AReplacementMayContainAnyCharacter) {
  EXPECT_EQ(ParseKey("A = s '%M%'", {{L"M", L"\u00e4\u03a9\u4e2d"}}).defaultValue,
            RegistryData(std::wstring(L"\u00e4\u03a9\u4e2d")));
}

TEST(RegistryScript, RefusesUnknownAndUnfinishedReplacements) {
  EXPECT_TRUE(RefusesLine("'%OTHER%'"));
  EXPECT_TRUE(RefusesLine("'%%'"));
  EXPECT_TRUE(RefusesLine("'100%'"));
  EXPECT_FALSE(Parse("HKCR { '%MODULES%' }", {{L"MODULE", L"x"}}));
}

TEST(RegistryScript, RefusesBrokenStructure) {
  for (const char* text : {"HKCR", "HKCR {", "HKCR { A", "HKCR { A {", "HKCR { A { }", "HKCR } {", "{ }",
                           "A { }", "HKCR { } }", "HKCR { { } }", "HKCR { = s 'a' }", "HKCR A { }",
                           "HKCU { }", "HKEY_CLASSES_ROOT { }", "HKCR { } A"}) {
    EXPECT_TRUE(Refuses(text)) << text;
  }
}

TEST(RegistryScript, RefusesBrokenLines) {
  for (const char* line : {"A =",
                           "A = s",
                           "A = 'text'",
                           "A = x 'text'",
                           "A = s = s",
                           "val",
                           "val A",
                           "val A =",
                           "val A s 'b'",
                           "val A = s",
                           "val A = d",
                           "val A = d ''",
                           "val A = d '1x'",
                           "val A = d '-1'",
                           "val A = d '4294967296'",
                           "val A = d '99999999999999999999999999'",
                           "val A = d '0x1'",
                           "ForceRemove",
                           "ForceRemove NoRemove A",
                           "NoRemove ForceRemove A",
                           "ForceRemove val",
                           "NoRemove { }",
                           "'A",
                           "'A\nB'",
                           "A = s 'b",
                           "A 'B' = d",
                           "val ForceRemove A = s 'b'",
                           "val val = s 'b'"}) {
    EXPECT_TRUE(RefusesLine(line)) << line;
  }
}

TEST(RegistryScript, RefusesAValueOfARoot) {
  EXPECT_TRUE(Refuses("HKCR { val A = s 'b' }"));
}

TEST(RegistryScript, RefusesKeyNamesThatWouldLeadElsewhere) {
  EXPECT_TRUE(RefusesLine("''"));
  EXPECT_TRUE(RefusesLine("ForceRemove ''"));
  EXPECT_TRUE(RefusesLine("'A\\B'"));
  EXPECT_FALSE(Parse("HKCR { '%M%' }", {{L"M", L"C:\\x.dll"}}));
}

TEST(RegistryScript, RefusesBytesThatAreNotPrintableAscii) {
  for (int byte = 0; byte < 256; ++byte) {
    const char c = static_cast<char>(byte);
    const bool isPrintable = byte >= 0x20 && byte < 0x7F && c != '\'' && c != '\\' && c != '%';
    EXPECT_EQ(RefusesLine("A = s 'x" + std::string(1, c) + "y'"), !isPrintable && c != '\t' && c != '\\')
        << byte;
  }
}

TEST(RegistryScript, RefusesKeysThatNestTooDeep) {
  const auto nested = [](std::size_t levels) {
    std::string text = "HKCR {";
    for (std::size_t i = 0; i < levels; ++i) text += " A {";
    for (std::size_t i = 0; i < levels; ++i) text += " }";
    return text + " }";
  };
  EXPECT_EQ(Parse(nested(kMaxKeyNesting))->back().depth, kMaxKeyNesting - 1);
  EXPECT_TRUE(Refuses(nested(kMaxKeyNesting + 1)));
  EXPECT_TRUE(Refuses(nested(100'000)));
}

TEST(RegistryScript, HandlesEveryTruncation) {
  const std::string text = "HKCR { NoRemove A = s 'b''c' { val 'D' = d '1' E } }";
  for (std::size_t length = 1; length < text.size(); ++length) {
    EXPECT_TRUE(Refuses(text.substr(0, length))) << length;
  }
  EXPECT_TRUE(Parse(text));
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
