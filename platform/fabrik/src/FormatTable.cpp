//===- FormatTable.cpp - The "table" formatter ------------------------------===//
//
// One row per structure, aligned columns, optionally a wrapped last column.
// The layout is described in Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <ostream>

namespace Fabrik::Format::Detail {

using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaStruct;

namespace {

/// Blanks between two columns.
const std::string ColumnGap = "  ";
/// Terminal width when COLUMNS does not give one.
constexpr std::size_t DefaultWidth = 80;
/// The narrowest a wrapped last column becomes, however wide the others are.
constexpr std::size_t MinWrapWidth = 10;

/// The terminal width from the environment variable COLUMNS.
std::size_t TerminalWidth() {
  const char* text = std::getenv("COLUMNS");
  if (!text || !*text)
    return DefaultWidth;
  char* end = nullptr;
  errno = 0;
  long value = std::strtol(text, &end, 10);
  if (errno != 0 || *end != '\0' || value <= 0)
    return DefaultWidth;
  return static_cast<std::size_t>(value);
}

/// Splits \p text at blanks into lines of at most \p width characters; a word
/// longer than \p width gets a line of its own. Empty text gives one empty
/// line.
std::vector<std::string> Wrap(const std::string& text, std::size_t width) {
  std::vector<std::string> lines;
  std::string line;
  std::size_t begin = 0;
  while (begin < text.size()) {
    std::size_t end = text.find(' ', begin);
    if (end == std::string::npos)
      end = text.size();
    if (end > begin) {
      std::string word = text.substr(begin, end - begin);
      if (line.empty()) {
        line = std::move(word);
      } else if (DisplayWidth(line) + 1 + DisplayWidth(word) <= width) {
        line += ' ';
        line += word;
      } else {
        lines.push_back(std::move(line));
        line = std::move(word);
      }
    }
    begin = end + 1;
  }
  lines.push_back(std::move(line));
  return lines;
}

/// Pads \p text with blanks to \p width characters.
std::string Pad(const std::string& text, std::size_t width) {
  std::size_t used = DisplayWidth(text);
  return used >= width ? text : text + std::string(width - used, ' ');
}

void WriteLine(std::ostream& out, std::string line) {
  line.erase(line.find_last_not_of(' ') + 1);
  out << line << '\n';
}

class TableFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root, const Parameters& params) const override;
};

void TableFormatter::Write(std::ostream& out, const MetaObjectPtr& root,
                           const Parameters& params) const {
  // The rows, and the structure that names the columns.
  std::vector<const MetaStruct*> rows;
  const MetaStruct* shape = nullptr;
  if (root && root->GetType() == MetaObj::List &&
      !IsPlainList(static_cast<const MetaList&>(*root))) {
    const auto& list = static_cast<const MetaList&>(*root);
    for (const MetaObjectPtr& item : list.GetItems()) {
      if (item && item->GetType() == MetaObj::Struct)
        rows.push_back(static_cast<const MetaStruct*>(item.get()));
    }
    const MetaObjectPtr& element = list.GetElementTemplate();
    if (element && element->GetType() == MetaObj::Struct)
      shape = static_cast<const MetaStruct*>(element.get());
    else if (!rows.empty())
      shape = rows.front();
  } else {
    WriteSimple(out, root, params);
    return;
  }
  if (rows.empty() || !shape)
    return;

  std::vector<std::string> columns;
  for (const MetaStruct::Field* field : SelectFields(*shape, params, true, Style::Table))
    columns.push_back(field->name);
  if (columns.empty())
    return;

  std::vector<std::vector<std::string>> cells;
  cells.reserve(rows.size());
  for (const MetaStruct* row : rows) {
    std::vector<std::string>& line = cells.emplace_back();
    for (const std::string& column : columns) {
      const MetaObjectPtr* value = row->GetField(column);
      line.push_back(
          value ? EscapeControls(WithUnit(CompactText(*value, params), *row, column, params)) : "");
    }
  }

  const bool showHeader = BoolParameter(params, "show-header", true);
  const std::size_t last = columns.size() - 1;
  std::vector<std::size_t> widths(columns.size(), 0);
  for (std::size_t c = 0; c < columns.size(); ++c) {
    if (showHeader)
      widths[c] = DisplayWidth(columns[c]);
    for (const auto& line : cells)
      widths[c] = std::max(widths[c], DisplayWidth(line[c]));
  }

  // The last column starts after the others and their gaps.
  std::size_t lastStart = 0;
  for (std::size_t c = 0; c < last; ++c)
    lastStart += widths[c] + ColumnGap.size();

  std::vector<std::vector<std::string>> lastLines;
  lastLines.reserve(rows.size());
  if (BoolParameter(params, "wrap-last", false)) {
    std::size_t terminal = TerminalWidth();
    std::size_t room = terminal > lastStart ? terminal - lastStart : 0;
    room = std::max(room, MinWrapWidth);
    widths[last] = showHeader ? DisplayWidth(columns[last]) : 0;
    for (const auto& line : cells) {
      lastLines.push_back(Wrap(line[last], room));
      for (const std::string& part : lastLines.back())
        widths[last] = std::max(widths[last], DisplayWidth(part));
    }
  } else {
    for (const auto& line : cells)
      lastLines.push_back({line[last]});
  }

  if (showHeader) {
    std::string names;
    std::string dashes;
    for (std::size_t c = 0; c < columns.size(); ++c) {
      if (c != 0) {
        names += ColumnGap;
        dashes += ColumnGap;
      }
      names += Pad(columns[c], widths[c]);
      dashes += std::string(widths[c], '-');
    }
    WriteLine(out, std::move(names));
    WriteLine(out, std::move(dashes));
  }
  for (std::size_t r = 0; r < cells.size(); ++r) {
    std::string line;
    for (std::size_t c = 0; c < last; ++c)
      line += Pad(cells[r][c], widths[c]) + ColumnGap;
    WriteLine(out, line + lastLines[r].front());
    for (std::size_t i = 1; i < lastLines[r].size(); ++i)
      WriteLine(out, std::string(lastStart, ' ') + lastLines[r][i]);
  }
}

} // namespace

std::unique_ptr<Formatter> MakeTableFormatter() {
  return std::make_unique<TableFormatter>();
}

} // namespace Fabrik::Format::Detail
