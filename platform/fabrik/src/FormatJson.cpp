//===- FormatJson.cpp - The "json" formatter --------------------------------===//
//
// A small pretty-printing JSON writer over typed values. The layout is
// described in Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <ostream>

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

/// The length of the well-formed UTF-8 sequence at \p pos of \p text, or 0
/// when the byte there does not start one. Overlong forms, surrogates and
/// code points above U+10FFFF are not well-formed.
std::size_t Utf8SequenceLength(const std::string& text, std::size_t pos) {
  auto byte = [&](std::size_t i) -> unsigned {
    return pos + i < text.size() ? static_cast<unsigned char>(text[pos + i]) : 0x100;
  };
  auto within = [](unsigned value, unsigned low, unsigned high) {
    return value >= low && value <= high;
  };
  const unsigned lead = byte(0);
  std::size_t length = 0;
  unsigned low = 0x80; // Accepted range of the second byte.
  unsigned high = 0xBF;
  if (within(lead, 0xC2, 0xDF)) {
    length = 2;
  } else if (within(lead, 0xE0, 0xEF)) {
    length = 3;
    if (lead == 0xE0)
      low = 0xA0;
    else if (lead == 0xED)
      high = 0x9F;
  } else if (within(lead, 0xF0, 0xF4)) {
    length = 4;
    if (lead == 0xF0)
      low = 0x90;
    else if (lead == 0xF4)
      high = 0x8F;
  } else {
    return 0;
  }
  if (!within(byte(1), low, high))
    return 0;
  for (std::size_t i = 2; i < length; ++i) {
    if (!within(byte(i), 0x80, 0xBF))
      return 0;
  }
  return length;
}

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

class JsonWriter {
public:
  JsonWriter(std::ostream& out, const Parameters& params) : out_(out), params_(params) {}

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
  void Array(const MetaList& list, std::size_t indent, bool atRoot) {
    if (list.GetItems().empty()) {
      out_ << "[]";
      return;
    }
    const std::string inner(indent + IndentStep, ' ');
    out_ << "[\n";
    bool first = true;
    for (const MetaObjectPtr& item : list.GetItems()) {
      if (!first)
        out_ << ",\n";
      first = false;
      out_ << inner;
      Value(item, indent + IndentStep, atRoot);
    }
    out_ << '\n' << std::string(indent, ' ') << ']';
  }

  void Object(const MetaStruct& value, std::size_t indent, bool atRoot) {
    const std::string inner(indent + IndentStep, ' ');
    bool first = true;
    for (const MetaStruct::Field* field : SelectFields(value, params_, atRoot, Style::Json)) {
      if (!IsShown(field->value))
        continue;
      out_ << (first ? "{\n" : ",\n") << inner;
      first = false;
      WriteString(out_, field->name);
      out_ << ": ";
      Value(field->value, indent + IndentStep, false);
    }
    if (first)
      out_ << "{}";
    else
      out_ << '\n' << std::string(indent, ' ') << '}';
  }

  std::ostream& out_;        ///< Destination.
  const Parameters& params_; ///< Formatter parameters.
};

class JsonFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    if (!root)
      return;
    JsonWriter writer(out, params);
    writer.Value(root, 0, /*atRoot=*/true);
    out << '\n';
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::unique_ptr<Formatter> MakeJsonFormatter() {
  return std::make_unique<JsonFormatter>();
}

} // namespace Fabrik::Format::Detail
