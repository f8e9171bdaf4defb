//===- FormatTable.cpp - The "table" formatter ------------------------------===//
//
// One row per structure, aligned columns, optionally a wrapped last column.
// The layout is described in Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <ostream>
#include <string_view>

namespace Fabrik::Format::Detail {

using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaStruct;
using MetaObj::MetaValue;

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
  line += '\n';
  out.write(line.data(), static_cast<std::streamsize>(line.size()));
}

/// The rows of a table, as they come: their cells go to a spool in a compact
/// form while the column widths grow; Finish lays them out. The columns are
/// the shown fields of \p shape.
class TableListWriter final : public ListWriter {
public:
  TableListWriter(const MetaStruct& shape, const Parameters& params) : params_(params) {
    for (std::size_t field : SelectFields(shape, params_, true, Style::Table))
      columns_.push_back(shape.GetFieldName(field));
    showHeader_ = BoolParameter(params_, "show-header", true);
    for (const std::string& column : columns_)
      widths_.push_back(showHeader_ ? DisplayWidth(column) : 0);
  }

  void Row(const MetaStruct& row) override {
    if (columns_.empty())
      return;
    const std::vector<std::size_t>& fields = Fields(row);
    // One record per row: each cell's width and length, then its text.
    record_.clear();
    for (std::size_t c = 0; c < columns_.size(); ++c) {
      cell_.clear();
      if (fields[c] != MetaObj::MetaLayout::npos) {
        cell_ = CompactText(row.GetFieldValue(fields[c]), params_);
        if (!cell_.empty() && units_[c]) {
          cell_ += ' ';
          cell_ += *units_[c];
        }
        if (NeedsEscapes(cell_))
          cell_ = EscapeControls(cell_);
      }
      const std::size_t width = DisplayWidth(cell_);
      widths_[c] = std::max(widths_[c], width);
      PutNumber(record_, width);
      PutNumber(record_, cell_.size());
      record_ += cell_;
    }
    spool_.AppendRecord(record_);
    ++rows_;
  }

  void Finish(std::ostream& out) override {
    if (rows_ == 0 || columns_.empty())
      return;
    const std::size_t last = columns_.size() - 1;
    // The last column starts after the others and their gaps.
    std::size_t lastStart = 0;
    for (std::size_t c = 0; c < last; ++c)
      lastStart += widths_[c] + ColumnGap.size();
    const bool wrap = BoolParameter(params_, "wrap-last", false);
    std::size_t room = 0;
    std::vector<Cell> cells(columns_.size());
    if (wrap) {
      std::size_t terminal = TerminalWidth();
      room = std::max(terminal > lastStart ? terminal - lastStart : 0, MinWrapWidth);
      widths_[last] = showHeader_ ? DisplayWidth(columns_[last]) : 0;
      Spool::Reader reader(spool_);
      while (ReadRow(reader, cells))
        for (const std::string& part : Wrap(std::string(cells[last].text), room))
          widths_[last] = std::max(widths_[last], DisplayWidth(part));
    }
    if (showHeader_) {
      std::string names;
      std::string dashes;
      for (std::size_t c = 0; c < columns_.size(); ++c) {
        if (c != 0) {
          names += ColumnGap;
          dashes += ColumnGap;
        }
        names += Pad(columns_[c], widths_[c]);
        dashes += std::string(widths_[c], '-');
      }
      WriteLine(out, std::move(names));
      WriteLine(out, std::move(dashes));
    }
    Spool::Reader reader(spool_);
    std::string line;
    std::string text;
    while (ReadRow(reader, cells)) {
      line.clear();
      for (std::size_t c = 0; c < last; ++c) {
        line += cells[c].text;
        line.append(widths_[c] - std::min(widths_[c], cells[c].width), ' ');
        line += ColumnGap;
      }
      if (!wrap) {
        line += cells[last].text;
        AppendLine(text, line);
      } else {
        std::vector<std::string> parts = Wrap(std::string(cells[last].text), room);
        AppendLine(text, line + parts.front());
        for (std::size_t i = 1; i < parts.size(); ++i)
          AppendLine(text, std::string(lastStart, ' ') + parts[i]);
      }
      if (text.size() >= 64 * 1024) {
        out.write(text.data(), static_cast<std::streamsize>(text.size()));
        text.clear();
      }
    }
    out.write(text.data(), static_cast<std::streamsize>(text.size()));
  }

private:
  /// The index in \p row of each column, or npos; kept per layout, which the
  /// rows of a listing share.
  const std::vector<std::size_t>& Fields(const MetaStruct& row) {
    const MetaObj::MetaLayout* layout = &row.GetLayout();
    if (layout != layout_) {
      layout_ = layout;
      fields_.clear();
      units_.clear();
      for (const std::string& column : columns_) {
        fields_.push_back(layout->Find(column));
        const std::string* unit = params_.Find("units:" + layout->GetName() + "." + column);
        units_.push_back(unit && !unit->empty() ? unit : nullptr);
      }
    }
    return fields_;
  }

  /// A cell of a row read back: its text (in record_) and its width.
  struct Cell {
    std::string_view text; ///< The cell's text.
    std::size_t width = 0; ///< Its width in characters.
  };

  static void PutNumber(std::string& record, std::size_t number) {
    const auto value = static_cast<std::uint32_t>(number);
    record.append(reinterpret_cast<const char*>(&value), sizeof value);
  }

  static std::size_t TakeNumber(const std::string& record, std::size_t& pos) {
    std::uint32_t value = 0;
    std::memcpy(&value, record.data() + pos, sizeof value);
    pos += sizeof value;
    return value;
  }

  /// The cells of the next row, pointing into record_; false after the last.
  bool ReadRow(Spool::Reader& reader, std::vector<Cell>& cells) {
    if (!reader.Next(record_))
      return false;
    std::size_t pos = 0;
    for (Cell& cell : cells) {
      cell.width = TakeNumber(record_, pos);
      const std::size_t size = TakeNumber(record_, pos);
      cell.text = std::string_view(record_).substr(pos, size);
      pos += size;
    }
    return true;
  }

  /// Appends \p line without its trailing blanks, and a line break.
  static void AppendLine(std::string& text, const std::string& line) {
    const std::size_t end = line.find_last_not_of(' ') + 1;
    text.append(line, 0, end);
    text += '\n';
  }

  Parameters params_;                           ///< Formatter parameters.
  std::vector<std::string> columns_;            ///< Column names.
  std::vector<std::size_t> widths_;             ///< Width of each column so far.
  bool showHeader_ = true;                      ///< Names and dashes above the rows.
  std::size_t rows_ = 0;                        ///< Rows handed over.
  Spool spool_;                                 ///< Cells, row by row.
  std::string cell_;                            ///< The cell being made.
  std::string record_;                          ///< The record of one row.
  const MetaObj::MetaLayout* layout_ = nullptr; ///< Layout fields_ belongs to.
  std::vector<std::size_t> fields_;             ///< Field index of each column in layout_.
  std::vector<const std::string*> units_;       ///< Unit of each column in layout_, or null.
};

class TableFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root, const Parameters& params) const override;
  std::unique_ptr<ListWriter> StreamList(const MetaStruct& element,
                                         const Parameters& params) const override {
    return std::make_unique<TableListWriter>(element, params);
  }
};

void TableFormatter::Write(std::ostream& out, const MetaObjectPtr& root,
                           const Parameters& params) const {
  const MetaValue value(root);
  if (!root || root->GetType() != MetaObj::List || IsPlainList(value.AsList())) {
    WriteSimple(out, value, params);
    return;
  }
  // The rows, and the structure that names the columns.
  const MetaList& list = value.AsList();
  const MetaStruct* shape = nullptr;
  const MetaObjectPtr& element = list.GetElementTemplate();
  if (element && element->GetType() == MetaObj::Struct)
    shape = static_cast<const MetaStruct*>(element.get());
  for (const MetaValue& item : list.GetItems())
    if (!shape && !item.IsNull() && item.GetType() == MetaObj::Struct)
      shape = &item.AsStruct();
  if (!shape)
    return;
  TableListWriter writer(*shape, params);
  for (const MetaValue& item : list.GetItems())
    if (!item.IsNull() && item.GetType() == MetaObj::Struct)
      writer.Row(item.AsStruct());
  writer.Finish(out);
}

} // namespace

std::unique_ptr<Formatter> MakeTableFormatter() {
  return std::make_unique<TableFormatter>();
}

} // namespace Fabrik::Format::Detail
