//===- FormatJson.cpp - The "json" formatter --------------------------------===//
//
// A small JSON writer over typed values: pretty-printed for the "json"
// formatter, on one line for the cells of "csv". The layout is described in
// Fabrik/Format.h.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <charconv>
#include <deque>
#include <ostream>
#include <string>
#include <vector>

namespace Fabrik::Format::Detail {

using MetaObj::MetaList;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaStruct;
using MetaObj::MetaValue;

namespace {

/// Blanks of indent per nesting level.
constexpr std::size_t IndentStep = 2;
/// Bytes of text the writer keeps before passing them on to its sink.
constexpr std::size_t FlushSize = 64 * 1024;

/// The bytes that a JSON string holds as they are: printable ASCII but the
/// quote and the backslash.
struct PlainBytes {
  bool plain[256] = {};
  constexpr PlainBytes() {
    for (int c = 0x20; c < 0x80; ++c)
      plain[c] = c != '"' && c != '\\';
  }
};
constexpr PlainBytes Plain;

/// True for a byte that a JSON string holds as it is.
inline bool IsPlain(unsigned char c) {
  return Plain.plain[c];
}

void WriteString(std::string& out, const std::string& text) {
  static const char Hex[] = "0123456789abcdef";
  std::size_t plain = 0;
  while (plain < text.size() && IsPlain(static_cast<unsigned char>(text[plain])))
    ++plain;
  if (plain == text.size()) {
    // Nearly every text: copied whole, between its quotes.
    const std::size_t at = out.size();
    out.resize(at + text.size() + 2);
    out[at] = '"';
    text.copy(out.data() + at + 1, text.size());
    out[at + text.size() + 1] = '"';
    return;
  }
  out += '"';
  std::size_t pos = 0;
  while (pos < text.size()) {
    // Runs of plain bytes, nearly all of most texts, are copied at once.
    std::size_t run = pos;
    while (run < text.size() && IsPlain(static_cast<unsigned char>(text[run])))
      ++run;
    out.append(text, pos, run - pos);
    pos = run;
    if (pos >= text.size())
      break;
    const unsigned char c = static_cast<unsigned char>(text[pos]);
    if (c == '"' || c == '\\') {
      out += '\\';
      out += static_cast<char>(c);
      ++pos;
    } else if (c < 0x20) {
      out += "\\u00";
      out += Hex[c >> 4];
      out += Hex[c & 0xF];
      ++pos;
    } else if (std::size_t length = Utf8SequenceLength(text, pos)) {
      out.append(text, pos, length);
      pos += length;
    } else {
      out += "\\ufffd";
      ++pos;
    }
  }
  out += '"';
}

/// Writes JSON values either pretty-printed (one item or member per line) or
/// compact (one line, no blanks) into a text buffer.
class JsonWriter {
public:
  /// Writes into \p out; with a \p sink, the text written so far is passed
  /// on to it in pieces, so that a long listing is not held twice.
  JsonWriter(std::string& out, const Parameters& params, bool pretty, std::ostream* sink = nullptr)
      : out_(out), params_(params), pretty_(pretty), sink_(sink) {}

  /// Passes the text written so far on to the sink.
  void Flush() {
    if (sink_ && !out_.empty()) {
      sink_->write(out_.data(), static_cast<std::streamsize>(out_.size()));
      out_.clear();
    }
  }

  /// Writes \p value; the caller has written the indent of its first line.
  void Value(const MetaValue& value, std::size_t indent, bool atRoot) {
    if (!IsShown(value)) {
      out_ += "null";
      return;
    }
    switch (value.GetType()) {
    case MetaObj::Boolean:
      out_ += value.GetBool() ? "true" : "false";
      return;
    case MetaObj::Integer: {
      char digits[24];
      auto end = std::to_chars(digits, digits + sizeof digits, value.GetInt()).ptr;
      out_.append(digits, end);
      return;
    }
    case MetaObj::String:
      WriteString(out_, value.GetString());
      return;
    case MetaObj::List:
      Array(value.AsList(), indent, atRoot);
      return;
    case MetaObj::Struct:
      Object(value.AsStruct(), indent, atRoot);
      return;
    }
    out_ += "null";
  }

  /// Starts the next item or member of a container at \p indent.
  void Separate(bool first, std::size_t indent) {
    if (!first)
      out_ += ',';
    if (pretty_) {
      out_ += '\n';
      out_.append(indent, ' ');
    }
  }

  /// Ends a non-empty container whose opening line is at \p indent.
  void Close(char bracket, std::size_t indent) {
    if (pretty_) {
      out_ += '\n';
      out_.append(indent, ' ');
    }
    out_ += bracket;
  }

  void Object(const MetaStruct& value, std::size_t indent, bool atRoot) {
    out_ += '{';
    bool first = true;
    // Selections live in a deque: writing nested structures may add some
    // without moving this one, but may change its prefixes (a structure of
    // the same kind at another depth), so they are looked up per field.
    Selection& selection = Select(value, atRoot);
    for (std::size_t i = 0; i < selection.indices.size(); ++i) {
      const MetaValue& field = value.GetFieldValue(selection.indices[i]);
      if (!IsShown(field))
        continue;
      if (!first)
        out_ += ',';
      first = false;
      out_ += Prefixes(selection, value, indent + IndentStep)[i];
      Value(field, indent + IndentStep, false);
    }
    if (first)
      out_ += '}';
    else
      Close('}', indent);
  }

private:
  /// The fields chosen for structures of one layout; the rows of a list
  /// share it, so the formatter parameters are read once per list.
  struct Selection {
    const MetaObj::MetaLayout* layout = nullptr; ///< Name and fields of the structures.
    bool atRoot = false;                         ///< Chosen for the root level.
    std::vector<std::size_t> indices;            ///< Indices of the chosen fields, in order.
    /// What precedes each chosen field's value at indent prefixIndent: the
    /// line break and indent (pretty) and the quoted name with its colon.
    std::vector<std::string> prefixes;
    std::size_t prefixIndent = std::string::npos; ///< Indent of prefixes.
  };

  Selection& Select(const MetaStruct& value, bool atRoot) {
    const MetaObj::MetaLayout* layout = &value.GetLayout();
    for (Selection& selection : selections_)
      if (selection.layout == layout && selection.atRoot == atRoot)
        return selection;
    Selection selection;
    selection.layout = layout;
    selection.atRoot = atRoot;
    selection.indices = SelectFields(value, params_, atRoot, Style::Machine);
    selections_.push_back(std::move(selection));
    return selections_.back();
  }

  /// The prefixes of \p selection's fields for members at \p indent.
  const std::vector<std::string>& Prefixes(Selection& selection, const MetaStruct& value,
                                           std::size_t indent) {
    if (selection.prefixIndent == indent)
      return selection.prefixes;
    selection.prefixes.clear();
    for (std::size_t index : selection.indices) {
      std::string prefix;
      if (pretty_) {
        prefix += '\n';
        prefix.append(indent, ' ');
      }
      WriteString(prefix, value.GetFieldName(index));
      prefix += pretty_ ? ": " : ":";
      selection.prefixes.push_back(std::move(prefix));
    }
    selection.prefixIndent = indent;
    return selection.prefixes;
  }

  void Array(const MetaList& list, std::size_t indent, bool atRoot) {
    out_ += '[';
    bool first = true;
    for (const MetaValue& item : list.GetItems()) {
      Separate(first, indent + IndentStep);
      first = false;
      Value(item, indent + IndentStep, atRoot);
      if (out_.size() >= FlushSize)
        Flush();
    }
    if (first)
      out_ += ']';
    else
      Close(']', indent);
  }

  std::string& out_;                 ///< Destination.
  const Parameters& params_;         ///< Formatter parameters.
  bool pretty_;                      ///< One item or member per line, indented.
  std::ostream* sink_;               ///< Where Flush passes the text on, if anywhere.
  std::deque<Selection> selections_; ///< Fields chosen so far, by structure.
};

/// A list at the root, row by row: the same text as JsonWriter::Array.
class JsonListWriter final : public SpoolWriter {
public:
  explicit JsonListWriter(const Parameters& params)
      : params_(params), writer_(Text(), params_, /*pretty=*/true) {
    Text() += '[';
  }
  void Row(const MetaStruct& row) override {
    writer_.Separate(rows_ == 0, IndentStep);
    writer_.Object(row, IndentStep, /*atRoot=*/true);
    ++rows_;
    Pass();
  }

private:
  void End(std::string& text, std::size_t rows) override {
    if (rows == 0)
      text += ']';
    else
      writer_.Close(']', 0);
    text += '\n';
  }

  Parameters params_; ///< Formatter parameters, kept for the writer.
  JsonWriter writer_; ///< Writes into the text of SpoolWriter.
};

class JsonFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    if (!root)
      return;
    std::string text;
    JsonWriter writer(text, params, /*pretty=*/true, &out);
    writer.Value(MetaValue(root), 0, /*atRoot=*/true);
    text += '\n';
    writer.Flush();
  }
  std::unique_ptr<ListWriter> StreamList(const MetaStruct& /*element*/,
                                         const Parameters& params) const override {
    return std::make_unique<JsonListWriter>(params);
  }
  bool IsMachineFormat() const override { return true; }
};

} // namespace

std::string CompactJson(const MetaValue& value, const Parameters& params) {
  std::string out;
  JsonWriter writer(out, params, /*pretty=*/false);
  writer.Value(value, 0, /*atRoot=*/false);
  return out;
}

std::unique_ptr<Formatter> MakeJsonFormatter() {
  return std::make_unique<JsonFormatter>();
}

} // namespace Fabrik::Format::Detail
