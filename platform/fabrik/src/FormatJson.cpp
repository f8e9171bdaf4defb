//===- FormatJson.cpp - The "json" formatter --------------------------------===//
//
// A small JSON writer over typed values: pretty-printed for the "json"
// formatter, on one line for the cells of "csv". The layout is described in
// Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <ostream>
#include <sstream>

namespace Fabrik::Format::Detail {

using MetaObj::MetaBool;
using MetaObj::MetaInt;
using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaString;
using MetaObj::MetaStruct;

namespace {

/// Blanks of indent per nesting level.
constexpr std::size_t IndentStep = 2;

void WriteString(std::ostream& out, const std::string& text) {
  static const char Hex[] = "0123456789abcdef";
  out << '"';
  std::size_t pos = 0;
  while (pos < text.size()) {
    const unsigned char c = static_cast<unsigned char>(text[pos]);
    if (c == '"' || c == '\\') {
      out << '\\' << static_cast<char>(c);
      ++pos;
    } else if (c < 0x20) {
      out << "\\u00" << Hex[c >> 4] << Hex[c & 0xF];
      ++pos;
    } else if (c < 0x80) {
      out << static_cast<char>(c);
      ++pos;
    } else if (std::size_t length = Utf8SequenceLength(text, pos)) {
      out.write(text.data() + pos, static_cast<std::streamsize>(length));
      pos += length;
    } else {
      out << "\\ufffd";
      ++pos;
    }
  }
  out << '"';
}

/// Writes JSON values either pretty-printed (one item or member per line) or
/// compact (one line, no blanks).
class JsonWriter {
public:
  JsonWriter(std::ostream& out, const Parameters& params, bool pretty)
      : out_(out), params_(params), pretty_(pretty) {}

  /// Writes \p value; the caller has written the indent of its first line.
  void Value(const MetaObjectPtr& value, std::size_t indent, bool atRoot) {
    if (!IsShown(value)) {
      out_ << "null";
      return;
    }
    switch (value->GetType()) {
    case MetaObj::Boolean:
      out_ << (static_cast<const MetaBool&>(*value).GetValue() ? "true" : "false");
      return;
    case MetaObj::Integer:
      out_ << static_cast<const MetaInt&>(*value).GetValue();
      return;
    case MetaObj::String:
      WriteString(out_, static_cast<const MetaString&>(*value).GetValue());
      return;
    case MetaObj::List:
      Array(static_cast<const MetaList&>(*value), indent, atRoot);
      return;
    case MetaObj::Struct:
      Object(static_cast<const MetaStruct&>(*value), indent, atRoot);
      return;
    }
    out_ << "null";
  }

private:
  /// Starts the next item or member of a container at \p indent.
  void Separate(bool first, std::size_t indent) {
    if (!first)
      out_ << ',';
    if (pretty_)
      out_ << '\n' << std::string(indent, ' ');
  }

  /// Ends a non-empty container whose opening line is at \p indent.
  void Close(char bracket, std::size_t indent) {
    if (pretty_)
      out_ << '\n' << std::string(indent, ' ');
    out_ << bracket;
  }

  void Array(const MetaList& list, std::size_t indent, bool atRoot) {
    out_ << '[';
    bool first = true;
    for (const MetaObjectPtr& item : list.GetItems()) {
      Separate(first, indent + IndentStep);
      first = false;
      Value(item, indent + IndentStep, atRoot);
    }
    if (first)
      out_ << ']';
    else
      Close(']', indent);
  }

  void Object(const MetaStruct& value, std::size_t indent, bool atRoot) {
    out_ << '{';
    bool first = true;
    for (const MetaStruct::Field* field : SelectFields(value, params_, atRoot, Style::Machine)) {
      if (!IsShown(field->value))
        continue;
      Separate(first, indent + IndentStep);
      first = false;
      WriteString(out_, field->name);
      out_ << (pretty_ ? ": " : ":");
      Value(field->value, indent + IndentStep, false);
    }
    if (first)
      out_ << '}';
    else
      Close('}', indent);
  }

  std::ostream& out_;        ///< Destination.
  const Parameters& params_; ///< Formatter parameters.
  bool pretty_;              ///< One item or member per line, indented.
};

class JsonFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    if (!root)
      return;
    JsonWriter writer(out, params, /*pretty=*/true);
    writer.Value(root, 0, /*atRoot=*/true);
    out << '\n';
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::string CompactJson(const MetaObjectPtr& value, const Parameters& params) {
  std::ostringstream out;
  JsonWriter writer(out, params, /*pretty=*/false);
  writer.Value(value, 0, /*atRoot=*/false);
  return out.str();
}

std::unique_ptr<Formatter> MakeJsonFormatter() {
  return std::make_unique<JsonFormatter>();
}

} // namespace Fabrik::Format::Detail
