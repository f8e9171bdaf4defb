//===- FormatCsv.cpp - The "csv" formatter ----------------------------------===//
//
// Writes a result as comma-separated values after RFC 4180: a header row of
// field names, then one record per structure. The layout is described in
// Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <algorithm>
#include <ostream>

namespace Fabrik::Format::Detail {

using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaStruct;
using MetaObj::MetaValue;

namespace {

/// The end of every record: a line feed, so that a shell reading a cell with
/// $(...) gets no carriage return.
constexpr const char* LineEnd = "\n";

/// Writes one record. A field holding a comma, a double quote, a carriage
/// return or a line feed is quoted, its quotes doubled; so is a record's only
/// field when it is empty, which would otherwise read as an empty line.
void WriteRecord(std::ostream& out, const std::vector<std::string>& fields) {
  bool first = true;
  for (const std::string& field : fields) {
    if (!first)
      out << ',';
    first = false;
    const bool quote = field.find_first_of(",\"\r\n") != std::string::npos ||
                       (field.empty() && fields.size() == 1);
    if (!quote) {
      out << field;
      continue;
    }
    out << '"';
    for (char c : field) {
      if (c == '"')
        out << '"';
      out << c;
    }
    out << '"';
  }
  out << LineEnd;
}

/// The text of one cell: a scalar as it stands (booleans true/false), a
/// structure or list as compact JSON, an unset or missing value empty.
std::string Cell(const MetaValue& value, const Parameters& params) {
  if (!IsShown(value))
    return "";
  if (value.GetType() == MetaObj::Struct || value.GetType() == MetaObj::List)
    return CompactJson(value, params);
  return ValidUtf8(ScalarText(value));
}

/// Adds the shown fields of \p structure that \p columns lacks, in order.
void AddColumns(std::vector<std::string>& columns, const MetaStruct& structure,
                const Parameters& params) {
  for (std::size_t field : SelectFields(structure, params, /*atRoot=*/true, Style::Machine)) {
    const std::string& name = structure.GetFieldName(field);
    if (std::find(columns.begin(), columns.end(), name) == columns.end())
      columns.push_back(name);
  }
}

/// The header record, unless show-header is false.
void WriteHeader(std::ostream& out, const std::vector<std::string>& columns,
                 const Parameters& params) {
  if (!BoolParameter(params, "show-header", true))
    return;
  std::vector<std::string> names;
  names.reserve(columns.size());
  for (const std::string& column : columns)
    names.push_back(ValidUtf8(column));
  WriteRecord(out, names);
}

/// The cells of \p row under \p columns.
void RowCells(const MetaStruct& row, const std::vector<std::string>& columns,
              const Parameters& params, std::vector<std::string>& record) {
  record.clear();
  for (const std::string& column : columns) {
    const MetaValue* value = row.GetField(column);
    record.push_back(value ? Cell(*value, params) : "");
  }
}

/// Writes a header row and one record per structure of \p rows. The columns
/// are the shown fields of \p shape (the list's element template, or null)
/// and of each row, in order of first appearance, so that no row loses a
/// field.
void WriteTable(std::ostream& out, const MetaStruct* shape,
                const std::vector<const MetaStruct*>& rows, const Parameters& params) {
  std::vector<std::string> columns;
  if (shape)
    AddColumns(columns, *shape, params);
  for (const MetaStruct* row : rows)
    AddColumns(columns, *row, params);
  if (columns.empty())
    return;
  WriteHeader(out, columns, params);
  std::vector<std::string> record;
  for (const MetaStruct* row : rows) {
    RowCells(*row, columns, params, record);
    WriteRecord(out, record);
  }
}

/// Writes a list: a table when its items are structures, else the column
/// "Value" with one record per item.
void WriteList(std::ostream& out, const MetaList& list, const Parameters& params) {
  std::vector<const MetaStruct*> rows;
  // The items decide; a list with no shown item goes by its element type.
  bool structures = list.GetElementType() == MetaObj::Struct;
  for (const MetaValue& item : list.GetItems()) {
    if (!IsShown(item))
      continue;
    structures = item.GetType() == MetaObj::Struct;
    if (!structures)
      break;
    rows.push_back(&item.AsStruct());
  }
  if (structures) {
    const MetaObjectPtr& element = list.GetElementTemplate();
    const MetaStruct* shape = element && element->GetType() == MetaObj::Struct
                                  ? static_cast<const MetaStruct*>(element.get())
                                  : nullptr;
    WriteTable(out, shape, rows, params);
    return;
  }
  if (BoolParameter(params, "show-header", true))
    WriteRecord(out, {"Value"});
  for (const MetaValue& item : list.GetItems()) {
    if (IsShown(item))
      WriteRecord(out, {Cell(item, params)});
  }
}

/// A list of structures at the root, row by row: the cells go to a spool,
/// as the header may still gain columns from later rows.
class CsvListWriter final : public ListWriter {
public:
  CsvListWriter(const MetaStruct& shape, const Parameters& params) : params_(params) {
    AddColumns(columns_, shape, params_);
  }
  void Row(const MetaStruct& row) override {
    if (&row.GetLayout() != layout_) {
      layout_ = &row.GetLayout();
      AddColumns(columns_, row, params_);
    }
    RowCells(row, columns_, params_, record_);
    spool_.AppendRecord(std::to_string(record_.size()));
    for (const std::string& cell : record_)
      spool_.AppendRecord(cell);
  }
  void Finish(std::ostream& out) override {
    if (columns_.empty())
      return;
    WriteHeader(out, columns_, params_);
    Spool::Reader reader(spool_);
    std::string count;
    while (reader.Next(count)) {
      record_.assign(columns_.size(), std::string());
      const std::size_t cells = std::stoul(count);
      for (std::size_t i = 0; i < cells; ++i)
        reader.Next(record_[i]);
      WriteRecord(out, record_);
    }
  }

private:
  Parameters params_;                           ///< Formatter parameters.
  std::vector<std::string> columns_;            ///< Columns so far.
  const MetaObj::MetaLayout* layout_ = nullptr; ///< Layout whose fields are in columns_.
  std::vector<std::string> record_;             ///< Cells of one row.
  Spool spool_;                                 ///< Cell count and cells, row by row.
};

class CsvFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    const MetaValue value(root);
    if (!IsShown(value))
      return;
    switch (value.GetType()) {
    case MetaObj::Struct:
      WriteTable(out, nullptr, {&value.AsStruct()}, params);
      return;
    case MetaObj::List:
      WriteList(out, value.AsList(), params);
      return;
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      WriteRecord(out, {Cell(value, params)});
      return;
    }
  }
  std::unique_ptr<ListWriter> StreamList(const MetaStruct& element,
                                         const Parameters& params) const override {
    return std::make_unique<CsvListWriter>(element, params);
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::unique_ptr<Formatter> MakeCsvFormatter() {
  return std::make_unique<CsvFormatter>();
}

} // namespace Fabrik::Format::Detail
