//===- FormatInternal.h - Pieces shared by the formatters -------------------===//
//
// Private to libfabrik. Each formatter lives in a file of its own
// (FormatSimple.cpp, FormatTable.cpp, FormatJson.cpp, ...) and exposes one
// factory function declared here; Format.cpp lists the factories in its table
// of names. Adding a formatter means adding its file, declaring its factory
// below and adding one line to that table.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Format.h"
#include "Fabrik/MetaObj.h"

#include <cstddef>
#include <iosfwd>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace Fabrik::Format::Detail {

/// Factories of the formatters, one per source file.
std::unique_ptr<Formatter> MakeSimpleFormatter();
std::unique_ptr<Formatter> MakeTableFormatter();
std::unique_ptr<Formatter> MakeJsonFormatter();
std::unique_ptr<Formatter> MakeXmlFormatter();
std::unique_ptr<Formatter> MakeCsvFormatter();
std::unique_ptr<Formatter> MakeKeyValueFormatter();

/// Which formatter asks; the order of the keys that select fields differs.
/// Machine is every machine format: "json", "xml", "csv" and "keyvalue".
enum class Style { Simple, Table, Machine };

/// Writes \p root as the "simple" formatter does; "table" falls back to it.
void WriteSimple(std::ostream& out, const MetaObj::MetaValue& root, const Parameters& params);

/// Streams a list at the root as the "simple" formatter writes it.
std::unique_ptr<ListWriter> MakeSimpleListWriter(const Parameters& params);

/// Splits a comma-separated list of names, trimming blanks around each name
/// and dropping empty names.
std::vector<std::string> SplitNames(const std::string& value);

/// The indices of the fields of \p value to show, in order. \p atRoot is
/// true for the root structure and the elements of a list at the root, where
/// "fields" applies.
std::vector<std::size_t> SelectFields(const MetaObj::MetaStruct& value, const Parameters& params,
                                      bool atRoot, Style style);

/// True when \p value exists and, for a scalar, has been given a value.
inline bool IsShown(const MetaObj::MetaValue& value) {
  return value.IsShown();
}

/// True for a list whose items are all scalars (a list of strings).
bool IsPlainList(const MetaObj::MetaList& list);

/// The text of a boolean, integer or string; empty for anything else.
std::string ScalarText(const MetaObj::MetaValue& value);

/// One-line text of any value, as a table cell shows it: a list of strings
/// joined by ", ", a structure as "{A: x, B: y}", a list of structures as
/// "[{...}, {...}]"; empty for a null or unset value.
std::string CompactText(const MetaObj::MetaValue& value, const Parameters& params);

/// The header line of \p value's blocks with its %Field% references
/// replaced, or null when header:S is absent, empty or "<NONE>".
std::optional<std::string> HeaderLine(const MetaObj::MetaStruct& value, const Parameters& params);

/// \p text followed by a blank and the unit of field \p field of \p value,
/// when units:S.F is given and \p text is not empty.
std::string WithUnit(std::string text, const MetaObj::MetaStruct& value, const std::string& field,
                     const Parameters& params);

/// The boolean value of \p key, or \p fallback when absent or not a boolean.
bool BoolParameter(const Parameters& params, const std::string& key, bool fallback);

/// The number of characters of UTF-8 text (bytes that do not continue a
/// sequence).
std::size_t DisplayWidth(const std::string& text);

/// The length of the well-formed UTF-8 sequence at \p pos of \p text, or 0
/// when the byte there does not start one (ASCII bytes are sequences of 1).
/// Overlong forms, surrogates and code points above U+10FFFF are not
/// well-formed.
std::size_t Utf8SequenceLength(const std::string& text, std::size_t pos);

/// \p text with each byte that is not part of a well-formed UTF-8 sequence
/// replaced by U+FFFD.
std::string ValidUtf8(const std::string& text);

/// True when \p text holds a character that EscapeControls writes as an
/// escape with Escapes::Controls.
bool NeedsEscapes(const std::string& text);

/// Which characters EscapeControls writes as escapes.
enum class Escapes {
  /// Every C0 control character, DEL and every C1 control character
  /// (U+0080 to U+009F): text that can neither add a line nor reach a
  /// terminal as an escape sequence ("simple", "table").
  Controls,
  /// Every character a line-splitting reader may take as a line end: line
  /// feed, carriage return, VT, FF, FS, GS, RS, NEL, U+2028 and U+2029, and
  /// the backslash itself, so that the text can be read back ("keyvalue").
  LineEnds,
};

/// \p text with the characters \p which selects written as "\n", "\r",
/// "\t", "\v", "\f", "\xHH" (other single bytes) or "\uHHHH".
std::string EscapeControls(const std::string& text, Escapes which = Escapes::Controls);

/// The name of a type in the machine formats: "boolean", "integer",
/// "string", "structure" or "list".
const char* TypeName(MetaObj::MetaType type);

/// The name of the structures of a list: the element template's name, else
/// that of the first structure item; null when it has neither.
const std::string* ElementStructName(const MetaObj::MetaList& list);

/// \p value as JSON on one line, without blanks ({"A":1,"B":["x"]}), with
/// the fields of nested structures selected as "json" selects them below the
/// root. An unset or null value is "null".
std::string CompactJson(const MetaObj::MetaValue& value, const Parameters& params);

/// Text put aside while a listing streams: held in memory up to a few MiB,
/// then in an unlinked temporary file. Throws std::runtime_error when the
/// file cannot be made or written.
class Spool {
public:
  Spool() = default;
  ~Spool();
  Spool(const Spool&) = delete;
  Spool& operator=(const Spool&) = delete;

  void Append(const char* data, std::size_t size);
  void Append(const std::string& text) { Append(text.data(), text.size()); }
  /// Appends \p text with its length in front, for Reader::Next.
  void AppendRecord(const std::string& text);
  bool Empty() const { return inFile_ == 0 && memory_.empty(); }
  /// The text not yet in the file: a writer may append to it and then call
  /// Grown, instead of Append.
  std::string& Memory() {
    if (memory_.capacity() < SpoolMemory)
      Reserve();
    return memory_;
  }
  /// Moves the text to the file once it is large.
  void Grown();
  /// Writes everything appended to \p out.
  void CopyTo(std::ostream& out);

  /// Reads the records of AppendRecord back, from the first.
  class Reader {
  public:
    explicit Reader(Spool& spool);
    /// The next record into \p text; false after the last.
    bool Next(std::string& text);

  private:
    bool Fill(std::size_t want);
    Spool& spool_;           ///< What is read.
    std::string buffer_;     ///< Bytes read and not yet taken.
    std::size_t pos_ = 0;    ///< First byte of buffer_ not yet taken.
    std::size_t offset_ = 0; ///< Bytes of the file read so far.
  };

  /// Bytes a spool holds in memory before it moves to a file.
  static constexpr std::size_t SpoolMemory = 4 << 20;

private:
  void Reserve();
  void Spill();
  std::string memory_;     ///< Text not (yet) in the file.
  int fd_ = -1;            ///< The temporary file, once memory grew too large.
  std::size_t inFile_ = 0; ///< Bytes in the file.
};

/// A list writer that formats rows as text into a spool; End adds what
/// follows the last row. Most formatters derive from it.
class SpoolWriter : public ListWriter {
public:
  void Finish(std::ostream& out) override;

protected:
  /// Where the text of the rows goes.
  std::string& Text() { return spool_.Memory(); }
  /// Moves the text gathered so far to the spool's file once it is large.
  void Pass() { spool_.Grown(); }
  /// What comes after the last row; \p rows counts the rows handed over.
  virtual void End(std::string& text, std::size_t rows) = 0;
  std::size_t rows_ = 0; ///< Rows handed over so far.

private:
  Spool spool_; ///< Text of the rows so far.
};

} // namespace Fabrik::Format::Detail
