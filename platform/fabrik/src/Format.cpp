//===- Format.cpp - Formatter table and shared formatting rules ------------===//
//
// The table of formatter names, the parameter container, and the rules that
// several formatters share: which fields are shown, how a value reads as one
// line of text, header lines and units, UTF-8 checks and type names.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <ostream>
#include <stdexcept>
#include <unistd.h>

namespace Fabrik::Format {

using MetaObj::MetaList;
using MetaObj::MetaStruct;
using MetaObj::MetaValue;

namespace {

/// One formatter: the name users give and the function that makes it.
struct FormatterEntry {
  const char* name;                     ///< Name as given to --formatter.
  std::unique_ptr<Formatter> (*make)(); ///< Factory.
};

/// Every formatter, in the order FormatterNames lists them.
constexpr FormatterEntry Formatters[] = {
    {"simple", Detail::MakeSimpleFormatter},     // "Field: value" lines and blocks.
    {"table", Detail::MakeTableFormatter},       // Aligned columns.
    {"json", Detail::MakeJsonFormatter},         // Machine format: JSON.
    {"xml", Detail::MakeXmlFormatter},           // Machine format: typed XML.
    {"csv", Detail::MakeCsvFormatter},           // Machine format: RFC 4180 records.
    {"keyvalue", Detail::MakeKeyValueFormatter}, // Machine format: path=value lines.
};

std::string Trim(const std::string& text) {
  std::size_t begin = text.find_first_not_of(" \t");
  if (begin == std::string::npos)
    return "";
  std::size_t end = text.find_last_not_of(" \t");
  return text.substr(begin, end - begin + 1);
}

std::string Lower(std::string text) {
  for (char& c : text)
    c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

/// The value of the first key of \p keys that is set, or null.
const std::string* FindFirst(const Parameters& params, std::initializer_list<std::string> keys) {
  for (const std::string& key : keys) {
    if (const std::string* value = params.Find(key))
      return value;
  }
  return nullptr;
}

} // namespace

void Parameters::Set(const std::string& key, const std::string& value) {
  for (auto& pair : pairs_) {
    if (pair.first == key) {
      pair.second = value;
      return;
    }
  }
  pairs_.emplace_back(key, value);
}

const std::string* Parameters::Find(const std::string& key) const {
  for (const auto& pair : pairs_) {
    if (pair.first == key)
      return &pair.second;
  }
  return nullptr;
}

Formatter::~Formatter() = default;

std::unique_ptr<Formatter> MakeFormatter(const std::string& name) {
  for (const FormatterEntry& entry : Formatters) {
    if (name == entry.name)
      return entry.make();
  }
  return nullptr;
}

std::vector<std::string> FormatterNames() {
  std::vector<std::string> names;
  for (const FormatterEntry& entry : Formatters)
    names.emplace_back(entry.name);
  return names;
}

namespace Detail {

std::vector<std::string> SplitNames(const std::string& value) {
  std::vector<std::string> names;
  std::size_t begin = 0;
  while (begin <= value.size()) {
    std::size_t end = value.find(',', begin);
    if (end == std::string::npos)
      end = value.size();
    std::string name = Trim(value.substr(begin, end - begin));
    if (!name.empty())
      names.push_back(std::move(name));
    begin = end + 1;
  }
  return names;
}

std::vector<std::size_t> SelectFields(const MetaStruct& value, const Parameters& params,
                                      bool atRoot, Style style) {
  const std::string& name = value.GetName();
  const std::string fieldsKey = "fields:" + name;
  const std::string columnsKey = "table-columns:" + name;
  const std::string* list = atRoot ? params.Find("fields") : nullptr;
  if (!list) {
    switch (style) {
    case Style::Simple:
      list = FindFirst(params, {fieldsKey, columnsKey});
      if (!list && atRoot)
        list = params.Find("table-columns");
      break;
    case Style::Table:
      list = params.Find(columnsKey);
      if (!list && atRoot)
        list = params.Find("table-columns");
      if (!list)
        list = params.Find(fieldsKey);
      break;
    case Style::Machine:
      list = params.Find(fieldsKey);
      break;
    }
  }

  std::vector<std::size_t> fields;
  const std::size_t count = value.GetFieldCount();
  if (!list) {
    for (std::size_t i = 0; i < count; ++i)
      fields.push_back(i);
    return fields;
  }
  for (const std::string& wanted : SplitNames(*list)) {
    const std::size_t index = value.GetLayout().Find(wanted);
    if (index < count && std::find(fields.begin(), fields.end(), index) == fields.end())
      fields.push_back(index);
  }
  return fields;
}

bool IsPlainList(const MetaList& list) {
  if (list.GetElementType() == MetaObj::Struct)
    return false;
  return std::all_of(list.GetItems().begin(), list.GetItems().end(), [](const MetaValue& item) {
    return item.IsNull() || (item.GetType() != MetaObj::Struct && item.GetType() != MetaObj::List);
  });
}

std::string ScalarText(const MetaValue& value) {
  switch (value.GetType()) {
  case MetaObj::Boolean:
    return value.GetBool() ? "true" : "false";
  case MetaObj::Integer:
    return std::to_string(value.GetInt());
  case MetaObj::String:
    return value.GetString();
  case MetaObj::Struct:
  case MetaObj::List:
    break;
  }
  return "";
}

namespace {

std::string CompactTextAt(const MetaValue& value, const Parameters& params, bool nested) {
  if (!IsShown(value))
    return "";
  switch (value.GetType()) {
  case MetaObj::Struct: {
    const MetaStruct& structure = value.AsStruct();
    std::string text = "{";
    bool first = true;
    for (std::size_t field : SelectFields(structure, params, /*atRoot=*/false, Style::Table)) {
      if (!IsShown(structure.GetFieldValue(field)))
        continue;
      if (!first)
        text += ", ";
      first = false;
      text += structure.GetFieldName(field) + ": " +
              CompactTextAt(structure.GetFieldValue(field), params, true);
    }
    return text + "}";
  }
  case MetaObj::List: {
    const MetaList& list = value.AsList();
    std::string text;
    bool first = true;
    for (const MetaValue& item : list.GetItems()) {
      if (!IsShown(item))
        continue;
      if (!first)
        text += ", ";
      first = false;
      text += CompactTextAt(item, params, true);
    }
    // A list of strings reads "a, b" in a cell of its own; anywhere else the
    // brackets keep its items apart from the neighbouring fields.
    if (nested || !IsPlainList(list))
      return "[" + text + "]";
    return text;
  }
  case MetaObj::Boolean:
  case MetaObj::Integer:
  case MetaObj::String:
    break;
  }
  return ScalarText(value);
}

} // namespace

std::string CompactText(const MetaValue& value, const Parameters& params) {
  return CompactTextAt(value, params, false);
}

std::optional<std::string> HeaderLine(const MetaStruct& value, const Parameters& params) {
  const std::string* header = params.Find("header:" + value.GetName());
  if (!header || header->empty() || *header == "<NONE>")
    return std::nullopt;
  std::string line;
  std::size_t pos = 0;
  while (pos < header->size()) {
    std::size_t open = header->find('%', pos);
    if (open == std::string::npos)
      break;
    std::size_t close = header->find('%', open + 1);
    if (close == std::string::npos)
      break;
    line.append(*header, pos, open - pos);
    const MetaValue* field = value.GetField(header->substr(open + 1, close - open - 1));
    if (field) {
      line += CompactText(*field, params);
      pos = close + 1;
    } else {
      // Not a field name: keep the "%" and look for a reference after it.
      line += '%';
      pos = open + 1;
    }
  }
  line.append(*header, pos, std::string::npos);
  return line;
}

std::string WithUnit(std::string text, const MetaStruct& value, const std::string& field,
                     const Parameters& params) {
  if (text.empty())
    return text;
  const std::string* unit = params.Find("units:" + value.GetName() + "." + field);
  if (unit && !unit->empty())
    text += " " + *unit;
  return text;
}

bool BoolParameter(const Parameters& params, const std::string& key, bool fallback) {
  const std::string* value = params.Find(key);
  if (!value)
    return fallback;
  const std::string text = Lower(Trim(*value));
  if (text == "true" || text == "1" || text == "yes" || text == "on")
    return true;
  if (text == "false" || text == "0" || text == "no" || text == "off")
    return false;
  return fallback;
}

std::size_t DisplayWidth(const std::string& text) {
  std::size_t continuations = 0;
  for (const char c : text)
    continuations += (static_cast<unsigned char>(c) & 0xC0) == 0x80;
  return text.size() - continuations;
}

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
  if (lead < 0x80)
    return 1;
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

std::string ValidUtf8(const std::string& text) {
  std::string valid;
  valid.reserve(text.size());
  std::size_t pos = 0;
  while (pos < text.size()) {
    if (std::size_t length = Utf8SequenceLength(text, pos)) {
      valid.append(text, pos, length);
      pos += length;
    } else {
      valid += "\xEF\xBF\xBD";
      ++pos;
    }
  }
  return valid;
}

bool NeedsEscapes(const std::string& text) {
  // C1 controls are encoded with the lead byte 0xC2.
  return std::any_of(text.begin(), text.end(), [](char c) {
    const auto byte = static_cast<unsigned char>(c);
    return byte < 0x20 || byte == 0x7F || byte == 0xC2;
  });
}

std::string EscapeControls(const std::string& text, Escapes which) {
  static const char* const kHex = "0123456789abcdef";
  // Nearly every text is printable ASCII or UTF-8 without C1 controls: it
  // stays as it is.
  if (which == Escapes::Controls && !NeedsEscapes(text))
    return text;
  std::string escaped;
  escaped.reserve(text.size());
  std::size_t pos = 0;
  while (pos < text.size()) {
    const auto c = static_cast<unsigned char>(text[pos]);
    const std::size_t length = std::max<std::size_t>(Utf8SequenceLength(text, pos), 1);
    unsigned code = c; // The code point of a well-formed sequence of up to 3 bytes.
    if (length == 2)
      code = ((c & 0x1Fu) << 6) | (static_cast<unsigned char>(text[pos + 1]) & 0x3Fu);
    else if (length == 3)
      code = ((c & 0x0Fu) << 12) | ((static_cast<unsigned char>(text[pos + 1]) & 0x3Fu) << 6) |
             (static_cast<unsigned char>(text[pos + 2]) & 0x3Fu);
    bool escape;
    if (which == Escapes::Controls)
      escape = code < 0x20 || code == 0x7F || (length == 2 && code >= 0x80 && code <= 0x9F);
    else
      escape = (length == 1 && (c == '\\' || c == '\n' || c == '\r' || c == '\v' || c == '\f' ||
                                (c >= 0x1C && c <= 0x1E))) ||
               (length == 2 && code == 0x85) || (length == 3 && (code == 0x2028 || code == 0x2029));
    if (!escape) {
      escaped.append(text, pos, length);
    } else if (code == '\n') {
      escaped += "\\n";
    } else if (code == '\r') {
      escaped += "\\r";
    } else if (code == '\t') {
      escaped += "\\t";
    } else if (code == '\v') {
      escaped += "\\v";
    } else if (code == '\f') {
      escaped += "\\f";
    } else if (code == '\\') {
      escaped += "\\\\";
    } else if (length == 1) {
      escaped += {'\\', 'x', kHex[code >> 4], kHex[code & 15]};
    } else {
      escaped += {'\\',
                  'u',
                  kHex[(code >> 12) & 15],
                  kHex[(code >> 8) & 15],
                  kHex[(code >> 4) & 15],
                  kHex[code & 15]};
    }
    pos += length;
  }
  return escaped;
}

const char* TypeName(MetaObj::MetaType type) {
  switch (type) {
  case MetaObj::Boolean:
    return "boolean";
  case MetaObj::Integer:
    return "integer";
  case MetaObj::String:
    return "string";
  case MetaObj::Struct:
    return "structure";
  case MetaObj::List:
    return "list";
  }
  return "string";
}

const std::string* ElementStructName(const MetaList& list) {
  const MetaObj::MetaObjectPtr& element = list.GetElementTemplate();
  if (element && element->GetType() == MetaObj::Struct)
    return &static_cast<const MetaStruct&>(*element).GetName();
  for (const MetaValue& item : list.GetItems()) {
    if (!item.IsNull() && item.GetType() == MetaObj::Struct)
      return &item.AsStruct().GetName();
  }
  return nullptr;
}

// Spool

namespace {

/// Bytes written to or read from the file at a time.
constexpr std::size_t SpoolChunk = 256 << 10;

[[noreturn]] void SpoolFailure(const char* what) {
  throw std::runtime_error(std::string("cannot ") + what +
                           " the temporary file of the listing: " + std::strerror(errno));
}

void WriteFully(int fd, const char* data, std::size_t size) {
  while (size > 0) {
    ssize_t done = ::write(fd, data, size);
    if (done < 0 && errno == EINTR)
      continue;
    if (done <= 0)
      SpoolFailure("write");
    data += done;
    size -= static_cast<std::size_t>(done);
  }
}

/// Reads up to \p size bytes at \p offset; 0 at the end.
std::size_t ReadAt(int fd, char* data, std::size_t size, std::size_t offset) {
  for (;;) {
    ssize_t done = ::pread(fd, data, size, static_cast<off_t>(offset));
    if (done < 0 && errno == EINTR)
      continue;
    if (done < 0)
      SpoolFailure("read");
    return static_cast<std::size_t>(done);
  }
}

} // namespace

Spool::~Spool() {
  if (fd_ >= 0)
    ::close(fd_);
}

void Spool::Spill() {
  if (fd_ < 0) {
    const char* dir = std::getenv("TMPDIR");
    std::string directory = dir && *dir ? dir : "/tmp";
    // An unnamed file where the system offers one; else a named one that is
    // unlinked at once. Either way nothing is left behind.
    fd_ = ::open(directory.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
    if (fd_ < 0) {
      std::string path = directory + "/ostracli-listing-XXXXXX";
      fd_ = ::mkostemp(path.data(), O_CLOEXEC);
      if (fd_ < 0)
        SpoolFailure("create");
      ::unlink(path.c_str());
    }
  }
  WriteFully(fd_, memory_.data(), memory_.size());
  inFile_ += memory_.size();
  memory_.clear();
}

void Spool::Append(const char* data, std::size_t size) {
  if (memory_.capacity() < Spool::SpoolMemory)
    Reserve();
  memory_.append(data, size);
  Grown();
}

void Spool::AppendRecord(const std::string& text) {
  const auto length = static_cast<std::uint32_t>(text.size());
  char prefix[sizeof length];
  std::memcpy(prefix, &length, sizeof length);
  Append(prefix, sizeof prefix);
  Append(text);
}

void Spool::CopyTo(std::ostream& out) {
  if (fd_ >= 0) {
    std::string chunk(SpoolChunk, '\0');
    std::size_t offset = 0;
    while (std::size_t got = ReadAt(fd_, chunk.data(), chunk.size(), offset)) {
      out.write(chunk.data(), static_cast<std::streamsize>(got));
      offset += got;
    }
  }
  out.write(memory_.data(), static_cast<std::streamsize>(memory_.size()));
}

Spool::Reader::Reader(Spool& spool) : spool_(spool) {}

bool Spool::Reader::Fill(std::size_t want) {
  if (buffer_.size() - pos_ >= want)
    return true;
  buffer_.erase(0, pos_);
  pos_ = 0;
  std::string chunk;
  while (buffer_.size() < want) {
    const std::size_t inFile = spool_.inFile_;
    if (offset_ < inFile) {
      if (chunk.empty())
        chunk.resize(std::max(want, SpoolChunk));
      std::size_t got =
          ReadAt(spool_.fd_, chunk.data(), std::min(chunk.size(), inFile - offset_), offset_);
      if (got == 0)
        return false;
      buffer_.append(chunk.data(), got);
      offset_ += got;
      continue;
    }
    // The file is read: the rest is in memory.
    const std::size_t start = offset_ - inFile;
    if (start >= spool_.memory_.size())
      return false;
    buffer_.append(spool_.memory_, start, std::string::npos);
    offset_ += spool_.memory_.size() - start;
  }
  return true;
}

bool Spool::Reader::Next(std::string& text) {
  std::uint32_t length = 0;
  if (!Fill(sizeof length))
    return false;
  std::memcpy(&length, buffer_.data() + pos_, sizeof length);
  pos_ += sizeof length;
  if (!Fill(length))
    return false;
  text.assign(buffer_, pos_, length);
  pos_ += length;
  return true;
}

// SpoolWriter

void Spool::Reserve() {
  // The whole of the memory at once: pages not written to are not used,
  // and the text is never copied to grow.
  memory_.reserve(Spool::SpoolMemory + SpoolChunk);
}

void Spool::Grown() {
  if (memory_.size() >= (fd_ < 0 ? Spool::SpoolMemory : SpoolChunk))
    Spill();
}

void SpoolWriter::Finish(std::ostream& out) {
  End(spool_.Memory(), rows_);
  spool_.Grown();
  spool_.CopyTo(out);
}

} // namespace Detail

} // namespace Fabrik::Format
