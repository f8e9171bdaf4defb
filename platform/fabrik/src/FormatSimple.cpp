//===- FormatSimple.cpp - The "simple" formatter ----------------------------===//
//
// One "Field Name: value" line per field, nested values as indented blocks.
// The layout is described in Fabrik/Format.h.
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

/// Extra indent of a nested block.
constexpr std::size_t IndentStep = 3;

/// Collects the lines of one result; blank lines carry no indent.
class SimpleWriter {
public:
  explicit SimpleWriter(const Parameters& params) : params_(params) {}

  void Root(const MetaValue& root) {
    if (!IsShown(root))
      return;
    switch (root.GetType()) {
    case MetaObj::Struct:
      Structure(root.AsStruct(), 0, /*atRoot=*/true);
      break;
    case MetaObj::List: {
      const MetaList& list = root.AsList();
      if (IsPlainList(list)) {
        for (const MetaValue& item : list.GetItems()) {
          if (IsShown(item))
            lines_.push_back(ScalarText(item));
        }
      } else {
        Blocks(list, 0, /*atRoot=*/true);
      }
      break;
    }
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      lines_.push_back(ScalarText(root));
      break;
    }
  }

  /// The lines of one structure block at \p indent, header first.
  void Structure(const MetaStruct& value, std::size_t indent, bool atRoot) {
    if (std::optional<std::string> header = HeaderLine(value, params_)) {
      lines_.push_back(std::string(indent, ' ') + *header);
      indent += IndentStep;
    }
    const std::string pad(indent, ' ');
    for (std::size_t field : SelectFields(value, params_, atRoot, Style::Simple)) {
      const MetaValue& item = value.GetFieldValue(field);
      const std::string& name = value.GetFieldName(field);
      if (!IsShown(item))
        continue;
      if (item.GetType() == MetaObj::Struct) {
        lines_.push_back(pad + name + ":");
        Structure(item.AsStruct(), indent + IndentStep, false);
        continue;
      }
      if (item.GetType() == MetaObj::List && !IsPlainList(item.AsList())) {
        lines_.push_back(pad + name + ":");
        Blocks(item.AsList(), indent + IndentStep, false);
        continue;
      }
      std::string text = WithUnit(CompactText(item, params_), value, name, params_);
      lines_.push_back(pad + name + ":" + (text.empty() ? "" : " " + text));
    }
  }

  std::vector<std::string>& Lines() { return lines_; }

private:
  /// The elements of a list of structures, one block each, with one blank
  /// line between blocks that have any lines.
  void Blocks(const MetaList& list, std::size_t indent, bool atRoot) {
    bool any = false;
    for (const MetaValue& item : list.GetItems()) {
      if (!IsShown(item))
        continue;
      const std::size_t start = lines_.size();
      if (any)
        lines_.emplace_back();
      const std::size_t first = lines_.size();
      if (item.GetType() == MetaObj::Struct)
        Structure(item.AsStruct(), indent, atRoot);
      else
        lines_.push_back(std::string(indent, ' ') + CompactText(item, params_));
      if (lines_.size() == first)
        lines_.resize(start); // An empty block: no separator either.
      else
        any = true;
    }
  }

  const Parameters& params_;       ///< Formatter parameters.
  std::vector<std::string> lines_; ///< Output lines, without line breaks.
};

/// Appends \p lines to \p text, each escaped and ended by a line break. The
/// layout itself holds no control characters: any a line holds come from
/// stored text, which must neither forge lines nor reach the terminal.
void AppendLines(std::string& text, const std::vector<std::string>& lines) {
  for (const std::string& line : lines) {
    text += EscapeControls(line);
    text += '\n';
  }
}

/// A list of structures at the root, block by block, as SimpleWriter::Blocks
/// writes it.
class SimpleListWriter final : public SpoolWriter {
public:
  explicit SimpleListWriter(const Parameters& params) : params_(params), writer_(params_) {}
  void Row(const MetaStruct& row) override {
    std::vector<std::string>& lines = writer_.Lines();
    lines.clear();
    writer_.Structure(row, 0, /*atRoot=*/true);
    if (lines.empty())
      return;
    if (rows_++ > 0)
      Text() += '\n';
    AppendLines(Text(), lines);
    Pass();
  }

private:
  void End(std::string& /*text*/, std::size_t /*rows*/) override {}

  Parameters params_;   ///< Formatter parameters, kept for the writer.
  SimpleWriter writer_; ///< Makes the lines of a block.
};

class SimpleFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    WriteSimple(out, MetaValue(root), params);
  }
  std::unique_ptr<ListWriter> StreamList(const MetaStruct& /*element*/,
                                         const Parameters& params) const override {
    return MakeSimpleListWriter(params);
  }
};

} // namespace

void WriteSimple(std::ostream& out, const MetaValue& root, const Parameters& params) {
  SimpleWriter writer(params);
  writer.Root(root);
  std::string text;
  AppendLines(text, writer.Lines());
  out << text;
}

std::unique_ptr<ListWriter> MakeSimpleListWriter(const Parameters& params) {
  return std::make_unique<SimpleListWriter>(params);
}

std::unique_ptr<Formatter> MakeSimpleFormatter() {
  return std::make_unique<SimpleFormatter>();
}

} // namespace Fabrik::Format::Detail
