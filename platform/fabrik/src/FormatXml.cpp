//===- FormatXml.cpp - The "xml" formatter ----------------------------------===//
//
// Writes a result as an XML 1.0 document in which every value keeps its type.
// The schema is described in Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <ostream>

namespace Fabrik::Format::Detail {

using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaStruct;
using MetaObj::MetaValue;

namespace {

/// Blanks of indent per nesting level.
constexpr std::size_t IndentStep = 2;

/// U+FFFD, written in place of what XML 1.0 cannot carry.
constexpr const char* Replacement = "\xEF\xBF\xBD";

/// \p text escaped for element content and double-quoted attribute values.
/// Markup characters become entities; tab, line feed and carriage return
/// become character references, so that parsers keep them as they are; the
/// other control characters, U+FFFE, U+FFFF and bytes that are not well-formed
/// UTF-8 become U+FFFD, as XML 1.0 does not allow them.
std::string Escape(const std::string& text) {
  std::string escaped;
  escaped.reserve(text.size());
  std::size_t pos = 0;
  while (pos < text.size()) {
    const char c = text[pos];
    const std::size_t length = Utf8SequenceLength(text, pos);
    if (length == 0) {
      escaped += Replacement;
      ++pos;
      continue;
    }
    if (length == 1) {
      switch (c) {
      case '&':
        escaped += "&amp;";
        break;
      case '<':
        escaped += "&lt;";
        break;
      case '>':
        escaped += "&gt;";
        break;
      case '"':
        escaped += "&quot;";
        break;
      case '\t':
        escaped += "&#9;";
        break;
      case '\n':
        escaped += "&#10;";
        break;
      case '\r':
        escaped += "&#13;";
        break;
      default:
        if (static_cast<unsigned char>(c) < 0x20)
          escaped += Replacement;
        else
          escaped += c;
        break;
      }
    } else if (text.compare(pos, length, "\xEF\xBF\xBE") == 0 ||
               text.compare(pos, length, "\xEF\xBF\xBF") == 0) {
      escaped += Replacement;
    } else {
      escaped.append(text, pos, length);
    }
    pos += length;
  }
  return escaped;
}

/// True when \p text holds something XML 1.0 cannot carry: a control
/// character other than tab, line feed and carriage return, U+FFFE, U+FFFF or
/// a byte that is not well-formed UTF-8.
bool NeedsBackslashes(const std::string& text) {
  for (std::size_t pos = 0; pos < text.size();) {
    const std::size_t length = Utf8SequenceLength(text, pos);
    if (length == 0)
      return true;
    const auto c = static_cast<unsigned char>(text[pos]);
    if (length == 1 && c < 0x20 && c != '\t' && c != '\n' && c != '\r')
      return true;
    if (text.compare(pos, length, "\xEF\xBF\xBE") == 0 ||
        text.compare(pos, length, "\xEF\xBF\xBF") == 0)
      return true;
    pos += length;
  }
  return false;
}

/// \p text with the backslash written "\\" and each byte XML cannot carry
/// written "\xHH", so that a reader gets every byte back.
std::string Backslashed(const std::string& text) {
  static const char* const kHex = "0123456789abcdef";
  std::string escaped;
  for (std::size_t pos = 0; pos < text.size();) {
    std::size_t length = Utf8SequenceLength(text, pos);
    const auto c = static_cast<unsigned char>(text[pos]);
    const bool bad = length == 0 ||
                     (length == 1 && c < 0x20 && c != '\t' && c != '\n' && c != '\r') ||
                     text.compare(pos, length, "\xEF\xBF\xBE") == 0 ||
                     text.compare(pos, length, "\xEF\xBF\xBF") == 0;
    if (length == 0)
      length = 1;
    if (c == '\\') {
      escaped += "\\\\";
    } else if (bad) {
      for (std::size_t i = 0; i < length; ++i) {
        const auto byte = static_cast<unsigned char>(text[pos + i]);
        escaped += {'\\', 'x', kHex[byte >> 4], kHex[byte & 15]};
      }
    } else {
      escaped.append(text, pos, length);
    }
    pos += length;
  }
  return escaped;
}

/// True for a boolean, integer or string, which is written on one line.
bool IsScalar(const MetaValue& value) {
  const MetaObj::MetaType type = value.GetType();
  return type != MetaObj::Struct && type != MetaObj::List;
}

/// Writes the elements of a result, one per line, indented by level.
class XmlWriter {
public:
  XmlWriter(std::string& out, const Parameters& params) : out_(out), params_(params) {}

  /// Writes the element of a shown \p value on lines of its own at \p indent.
  void Value(const MetaValue& value, std::size_t indent, bool atRoot) {
    switch (value.GetType()) {
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      out_.append(indent, ' ');
      Scalar(value);
      out_ += '\n';
      return;
    case MetaObj::List:
      List(value.AsList(), indent, atRoot);
      return;
    case MetaObj::Struct:
      Structure(value.AsStruct(), indent, atRoot);
      return;
    }
  }

  /// Opens a list element of \p type at \p indent, without ending its tag.
  void OpenList(MetaObj::MetaType type, std::size_t indent) {
    out_.append(indent, ' ');
    out_ += "<list type=\"";
    out_ += TypeName(type);
    out_ += '"';
  }

  /// Ends a list element opened at \p indent that holds \p items.
  void CloseList(std::size_t indent, bool empty) {
    if (empty) {
      out_ += "/>\n";
      return;
    }
    out_.append(indent, ' ');
    out_ += "</list>\n";
  }

  void Structure(const MetaStruct& value, std::size_t indent, bool atRoot) {
    out_.append(indent, ' ');
    out_ += "<structure typeName=\"";
    out_ += Escape(value.GetName());
    out_ += '"';
    bool first = true;
    for (std::size_t field : SelectFields(value, params_, atRoot, Style::Machine)) {
      const MetaValue& item = value.GetFieldValue(field);
      if (!IsShown(item))
        continue;
      if (first)
        out_ += ">\n";
      first = false;
      out_.append(indent + IndentStep, ' ');
      out_ += "<field name=\"";
      out_ += Escape(value.GetFieldName(field));
      out_ += "\">";
      if (IsScalar(item)) {
        Scalar(item);
      } else {
        out_ += '\n';
        Value(item, indent + 2 * IndentStep, false);
        out_.append(indent + IndentStep, ' ');
      }
      out_ += "</field>\n";
    }
    if (first) {
      out_ += "/>\n";
    } else {
      out_.append(indent, ' ');
      out_ += "</structure>\n";
    }
  }

private:
  /// Writes <boolean>, <integer> or <string> with its text, on the current line.
  /// A string XML cannot carry as it stands is written with backslash
  /// escapes and marked escaped="backslash".
  void Scalar(const MetaValue& value) {
    const char* name = TypeName(value.GetType());
    std::string text = ScalarText(value);
    out_ += '<';
    out_ += name;
    if (NeedsBackslashes(text)) {
      out_ += " escaped=\"backslash\">";
      out_ += Escape(Backslashed(text));
    } else {
      out_ += '>';
      out_ += Escape(text);
    }
    out_ += "</";
    out_ += name;
    out_ += '>';
  }

  void List(const MetaList& list, std::size_t indent, bool atRoot) {
    OpenList(list.GetElementType(), indent);
    bool first = true;
    for (const MetaValue& item : list.GetItems()) {
      if (!IsShown(item))
        continue;
      if (first)
        out_ += ">\n";
      first = false;
      Value(item, indent + IndentStep, atRoot);
    }
    CloseList(indent, first);
  }

  std::string& out_;         ///< Destination.
  const Parameters& params_; ///< Formatter parameters.
};

constexpr const char* Declaration = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

/// A list of structures at the root, structure by structure, as
/// XmlWriter::List writes it inside <output>.
class XmlListWriter final : public SpoolWriter {
public:
  explicit XmlListWriter(const Parameters& params) : params_(params), writer_(Text(), params_) {
    Text() += Declaration;
    Text() += "<output>\n";
    writer_.OpenList(MetaObj::Struct, IndentStep);
  }
  void Row(const MetaStruct& row) override {
    if (rows_++ == 0)
      Text() += ">\n";
    writer_.Structure(row, 2 * IndentStep, /*atRoot=*/true);
    Pass();
  }

private:
  void End(std::string& text, std::size_t rows) override {
    writer_.CloseList(IndentStep, rows == 0);
    text += "</output>\n";
  }

  Parameters params_; ///< Formatter parameters, kept for the writer.
  XmlWriter writer_;  ///< Writes into the text of SpoolWriter.
};

class XmlFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    if (!root)
      return;
    std::string text = Declaration;
    const MetaValue value(root);
    if (!IsShown(value)) {
      out << text << "<output/>\n";
      return;
    }
    text += "<output>\n";
    XmlWriter(text, params).Value(value, IndentStep, /*atRoot=*/true);
    text += "</output>\n";
    out << text;
  }
  std::unique_ptr<ListWriter> StreamList(const MetaStruct& /*element*/,
                                         const Parameters& params) const override {
    return std::make_unique<XmlListWriter>(params);
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::unique_ptr<Formatter> MakeXmlFormatter() {
  return std::make_unique<XmlFormatter>();
}

} // namespace Fabrik::Format::Detail
