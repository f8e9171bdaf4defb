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
std::string Cell(const MetaObjectPtr& value, const Parameters& params) {
  if (!IsShown(value))
    return "";
  if (value->GetType() == MetaObj::Struct || value->GetType() == MetaObj::List)
    return CompactJson(value, params);
  return ValidUtf8(ScalarText(*value));
}

/// The column names of a table of \p rows: the shown fields of \p shape (the
/// list's element template, or null) and of each row, in order of first
/// appearance, so that no row loses a field.
std::vector<std::string> Columns(const MetaStruct* shape,
                                 const std::vector<const MetaStruct*>& rows,
                                 const Parameters& params) {
  std::vector<std::string> columns;
  auto add = [&](const MetaStruct& structure) {
    for (const MetaStruct::Field* field :
         SelectFields(structure, params, /*atRoot=*/true, Style::Machine)) {
      if (std::find(columns.begin(), columns.end(), field->name) == columns.end())
        columns.push_back(field->name);
    }
  };
  if (shape)
    add(*shape);
  for (const MetaStruct* row : rows)
    add(*row);
  return columns;
}

/// Writes a header row and one record per structure of \p rows.
void WriteTable(std::ostream& out, const MetaStruct* shape,
                const std::vector<const MetaStruct*>& rows, const Parameters& params) {
  const std::vector<std::string> columns = Columns(shape, rows, params);
  if (columns.empty())
    return;
  if (BoolParameter(params, "show-header", true)) {
    std::vector<std::string> names;
    names.reserve(columns.size());
    for (const std::string& column : columns)
      names.push_back(ValidUtf8(column));
    WriteRecord(out, names);
  }
  std::vector<std::string> record;
  for (const MetaStruct* row : rows) {
    record.clear();
    for (const std::string& column : columns) {
      const MetaObjectPtr* value = row->GetField(column);
      record.push_back(value ? Cell(*value, params) : "");
    }
    WriteRecord(out, record);
  }
}

/// Writes a list: a table when its items are structures, else the column
/// "Value" with one record per item.
void WriteList(std::ostream& out, const MetaList& list, const Parameters& params) {
  std::vector<const MetaStruct*> rows;
  // The items decide; a list with no shown item goes by its element type.
  bool structures = list.GetElementType() == MetaObj::Struct;
  for (const MetaObjectPtr& item : list.GetItems()) {
    if (!IsShown(item))
      continue;
    structures = item->GetType() == MetaObj::Struct;
    if (!structures)
      break;
    rows.push_back(static_cast<const MetaStruct*>(item.get()));
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
  for (const MetaObjectPtr& item : list.GetItems()) {
    if (IsShown(item))
      WriteRecord(out, {Cell(item, params)});
  }
}

class CsvFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    if (!IsShown(root))
      return;
    switch (root->GetType()) {
    case MetaObj::Struct: {
      const auto* structure = static_cast<const MetaStruct*>(root.get());
      WriteTable(out, nullptr, {structure}, params);
      return;
    }
    case MetaObj::List:
      WriteList(out, static_cast<const MetaList&>(*root), params);
      return;
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      WriteRecord(out, {Cell(root, params)});
      return;
    }
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::unique_ptr<Formatter> MakeCsvFormatter() {
  return std::make_unique<CsvFormatter>();
}

} // namespace Fabrik::Format::Detail
