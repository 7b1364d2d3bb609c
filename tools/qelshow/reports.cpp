#include "reports.h"

#include <algorithm>
#include <cwchar>
#include <vector>

#include "text_tools.h"
#include "value_text.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

std::wstring OrDash(const std::wstring& text) {
  return text.empty() ? L"-" : text;
}

std::wstring Dimensions(std::int32_t width, std::int32_t height) {
  return std::to_wstring(width) + L" x " + std::to_wstring(height);
}

/// Returns `text` with every line after the first indented by `columns`.
std::wstring Indented(std::wstring_view text, std::size_t columns) {
  std::wstring indented;
  for (const wchar_t c : text) {
    if (c == L'\r') continue;
    indented += c;
    if (c == L'\n') indented.append(columns, L' ');
  }
  return indented;
}

std::wstring OneLine(std::wstring_view text) {
  std::wstring line;
  for (const wchar_t c : text) {
    if (c != L'\r') line += c == L'\n' ? L' ' : c;
  }
  return line;
}

std::wstring ValueOrProblem(const Value& value, const std::wstring& problem) {
  return problem.empty() ? OneLine(ValueText(value)) : L"(" + problem + L")";
}

std::wstring ColumnsText(const ListAnswer<Column>& columns) {
  std::vector<std::vector<std::wstring>> rows = {
      {L"title", L"property key", L"declared", L"returned", L"value"}};
  for (const Column& column : columns.items) {
    rows.push_back({column.title, column.set + L" " + std::to_wstring(column.id), column.declared,
                    OrDash(column.returned), ValueOrProblem(column.value, column.problem)});
  }
  return Grid(rows);
}

std::wstring PropertiesText(const ListAnswer<Property>& properties) {
  std::vector<std::vector<std::wstring>> rows = {{L"name", L"property key", L"type", L"value"}};
  for (const Property& property : properties.items) {
    rows.push_back({property.name, property.set + L" " + std::to_wstring(property.id), OrDash(property.type),
                    ValueOrProblem(property.value, property.problem)});
  }
  return Grid(rows);
}

std::wstring HeaderText(const std::vector<HeaderFact>& header) {
  if (header.empty()) return {};
  std::vector<std::vector<std::wstring>> rows;
  for (const HeaderFact& fact : header) {
    const std::wstring unit = fact.unit.empty() ? L"" : L" " + fact.unit;
    rows.push_back({fact.name, OneLine(ValueText(fact.value) + unit)});
  }
  return L"  Header\n" + Grid(rows);
}

template <class Answer>
std::wstring Section(const wchar_t* title, const Answer& answer, const std::wstring& text) {
  return std::wstring(L"  ") + title + L"\n" +
         (answer.problem.empty() ? text : L"    " + answer.problem + L"\n");
}

std::wstring ThumbnailText(const Thumbnail& thumbnail) {
  if (thumbnail.width == 0) return L"none";
  return Dimensions(thumbnail.width, thumbnail.height) + L", " + std::to_wstring(thumbnail.bitsPerPixel) +
         L" bits per pixel (" + Dimensions(thumbnail.request, thumbnail.request) + L" requested)";
}

}  // namespace

std::wstring TextReport(const FileFacts& facts) {
  std::wstring text = facts.named + L"\n";
  if (!facts.remark.empty()) text += L"  Remark      " + facts.remark + L"\n";
  if (facts.width > 0) {
    text += L"  Frame size  " + Dimensions(facts.width, facts.height) + L"\n";
    text += L"  Frames      " + std::to_wstring(facts.frames) + L"\n";
  }
  if (!facts.type.empty()) text += L"  Pixel type  " + facts.type + L"\n";
  text += L"  Thumbnail   " + ThumbnailText(facts.thumbnail) + L"\n";
  text += HeaderText(facts.header);
  text += Section(L"Tip", facts.tip, L"    " + Indented(facts.tip.text, 4) + L"\n");
  text += Section(L"Columns", facts.columns, ColumnsText(facts.columns));
  text += Section(L"Property sets", facts.propertySets, PropertiesText(facts.propertySets));
  text += Section(L"Property store", facts.propertyStore, PropertiesText(facts.propertyStore));
  return text;
}

namespace {

std::wstring TableLine(std::size_t nameWidth, std::wstring_view name, std::wstring_view dimensions,
                       std::wstring_view frames, std::wstring_view type, std::wstring_view thumbnail) {
  return Padded(name, nameWidth) + L"  " + Padded(dimensions, 13) + L"  " + Padded(frames, 6) + L"  " +
         Padded(type, 23) + L"  " + std::wstring(thumbnail) + L"\n";
}

}  // namespace

std::wstring TableHeading(std::size_t nameWidth) {
  return TableLine(nameWidth, L"NAME", L"FRAME SIZE", L"FRAMES", L"PIXEL TYPE", L"THUMBNAIL");
}

std::wstring TableRow(const FileFacts& facts, std::size_t nameWidth) {
  const bool known = facts.width > 0;
  return TableLine(nameWidth, facts.name, known ? Dimensions(facts.width, facts.height) : L"-",
                   known ? std::to_wstring(facts.frames) : L"-", OrDash(facts.type),
                   facts.png.empty() ? L"none: " + facts.problem
                                     : Dimensions(facts.thumbnail.width, facts.thumbnail.height));
}

}  // namespace Qel::Lumetra::ShellExt::Show
