//===- FormatKeyValue.cpp - The "keyvalue" formatter ------------------------===//
//
// Writes a result as one "path.type=value" line per scalar, for line-oriented
// tools. The layout is described in Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <cstring>
#include <ostream>

namespace Fabrik::Format::Detail {

using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaStruct;
using MetaObj::MetaValue;

namespace {

/// \p text as valid UTF-8 with the backslash and every character a
/// line-splitting reader could take as a line end escaped, and with a
/// backslash before each character of \p special.
std::string Escape(const std::string& text, const char* special) {
  std::string escaped = EscapeControls(ValidUtf8(text), Escapes::LineEnds);
  if (!*special)
    return escaped;
  std::string marked;
  marked.reserve(escaped.size());
  for (std::size_t i = 0; i < escaped.size(); ++i) {
    if (escaped[i] == '\\') { // An escape made above: keep it whole.
      marked.append(escaped, i, 2);
      ++i;
      continue;
    }
    if (escaped[i] != '\0' && std::strchr(special, escaped[i]))
      marked += '\\';
    marked += escaped[i];
  }
  return marked;
}

/// A structure or field name as one segment of a path.
std::string Segment(const std::string& name) {
  return Escape(name, ".[]=");
}

/// Writes the lines of a result, counting them to tell empty containers.
class KeyValueWriter {
public:
  KeyValueWriter(std::string& out, const Parameters& params) : out_(out), params_(params) {}

  /// Writes the lines of a shown \p value found at \p path.
  void Value(const MetaValue& value, const std::string& path, bool atRoot) {
    switch (value.GetType()) {
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      Line(path, TypeName(value.GetType()), ScalarText(value));
      return;
    case MetaObj::Struct:
      Structure(value.AsStruct(), path, atRoot);
      return;
    case MetaObj::List: {
      const MetaList& list = value.AsList();
      const std::size_t before = lines_;
      for (std::size_t i = 0; i < list.GetItems().size(); ++i) {
        if (IsShown(list.GetItems()[i]))
          Value(list.GetItems()[i], path + "[" + std::to_string(i) + "]", atRoot);
      }
      if (lines_ == before)
        Line(path, "list", "");
      return;
    }
    }
  }

  /// Writes the lines of \p structure found at \p path.
  void Structure(const MetaStruct& structure, const std::string& path, bool atRoot) {
    const std::size_t before = lines_;
    for (std::size_t field : SelectFields(structure, params_, atRoot, Style::Machine)) {
      if (IsShown(structure.GetFieldValue(field)))
        Value(structure.GetFieldValue(field),
              (path.empty() ? "" : path + ".") + Segment(structure.GetFieldName(field)), false);
    }
    if (lines_ == before)
      Line(path, "structure", "");
  }

  /// Writes one "PATH.TYPE=VALUE" line; an empty path leaves out the ".".
  void Line(const std::string& path, const char* type, const std::string& value) {
    if (!path.empty()) {
      out_ += path;
      out_ += '.';
    }
    out_ += type;
    out_ += '=';
    out_ += Escape(value, "");
    out_ += '\n';
    ++lines_;
  }

  std::size_t Lines() const { return lines_; }

private:
  std::string& out_;         ///< Destination.
  const Parameters& params_; ///< Formatter parameters.
  std::size_t lines_ = 0;    ///< Lines written so far.
};

/// The path of a list at the root: the name of its element structure.
std::string ListPath(const std::string* name) {
  return name ? Segment(*name) : std::string();
}

/// A list of structures at the root, item by item, as KeyValueWriter writes
/// a list.
class KeyValueListWriter final : public SpoolWriter {
public:
  KeyValueListWriter(const MetaStruct& element, const Parameters& params)
      : params_(params), path_(ListPath(&element.GetName())), writer_(Text(), params_) {}
  void Row(const MetaStruct& row) override {
    writer_.Structure(row, path_ + "[" + std::to_string(rows_++) + "]", /*atRoot=*/true);
    Pass();
  }

private:
  void End(std::string& /*text*/, std::size_t /*rows*/) override {
    if (writer_.Lines() == 0)
      writer_.Line(path_, "list", "");
  }

  Parameters params_;     ///< Formatter parameters, kept for the writer.
  std::string path_;      ///< Path of the list.
  KeyValueWriter writer_; ///< Writes into the text of SpoolWriter.
};

class KeyValueFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    const MetaValue value(root);
    if (!IsShown(value))
      return;
    // The root is named after its structure, or a list's element structure.
    std::string path;
    if (value.GetType() == MetaObj::Struct)
      path = Segment(value.AsStruct().GetName());
    else if (value.GetType() == MetaObj::List)
      path = ListPath(ElementStructName(value.AsList()));
    std::string text;
    KeyValueWriter(text, params).Value(value, path, /*atRoot=*/true);
    out << text;
  }
  std::unique_ptr<ListWriter> StreamList(const MetaStruct& element,
                                         const Parameters& params) const override {
    return std::make_unique<KeyValueListWriter>(element, params);
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::unique_ptr<Formatter> MakeKeyValueFormatter() {
  return std::make_unique<KeyValueFormatter>();
}

} // namespace Fabrik::Format::Detail
