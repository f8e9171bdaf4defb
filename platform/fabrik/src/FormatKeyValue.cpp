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
  KeyValueWriter(std::ostream& out, const Parameters& params) : out_(out), params_(params) {}

  /// Writes the lines of a shown \p value found at \p path.
  void Value(const MetaObjectPtr& value, const std::string& path, bool atRoot) {
    switch (value->GetType()) {
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      Line(path, TypeName(value->GetType()), ScalarText(*value));
      return;
    case MetaObj::Struct: {
      const auto& structure = static_cast<const MetaStruct&>(*value);
      const std::size_t before = lines_;
      for (const MetaStruct::Field* field :
           SelectFields(structure, params_, atRoot, Style::Machine)) {
        if (IsShown(field->value))
          Value(field->value, (path.empty() ? "" : path + ".") + Segment(field->name), false);
      }
      if (lines_ == before)
        Line(path, "structure", "");
      return;
    }
    case MetaObj::List: {
      const auto& list = static_cast<const MetaList&>(*value);
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

private:
  /// Writes one "PATH.TYPE=VALUE" line; an empty path leaves out the ".".
  void Line(const std::string& path, const char* type, const std::string& value) {
    if (!path.empty())
      out_ << path << '.';
    out_ << type << '=' << Escape(value, "") << '\n';
    ++lines_;
  }

  std::ostream& out_;        ///< Destination.
  const Parameters& params_; ///< Formatter parameters.
  std::size_t lines_ = 0;    ///< Lines written so far.
};

class KeyValueFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    if (!IsShown(root))
      return;
    // The root is named after its structure, or a list's element structure.
    std::string path;
    if (root->GetType() == MetaObj::Struct) {
      path = Segment(static_cast<const MetaStruct&>(*root).GetName());
    } else if (root->GetType() == MetaObj::List) {
      if (const std::string* name = ElementStructName(static_cast<const MetaList&>(*root)))
        path = Segment(*name);
    }
    KeyValueWriter(out, params).Value(root, path, /*atRoot=*/true);
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::unique_ptr<Formatter> MakeKeyValueFormatter() {
  return std::make_unique<KeyValueFormatter>();
}

} // namespace Fabrik::Format::Detail
