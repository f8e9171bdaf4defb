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

namespace {

/// Extra indent of a nested block.
constexpr std::size_t IndentStep = 3;

/// Collects the lines of one result; blank lines carry no indent.
class SimpleWriter {
public:
  explicit SimpleWriter(const Parameters& params) : params_(params) {}

  void Root(const MetaObjectPtr& root) {
    if (!IsShown(root))
      return;
    switch (root->GetType()) {
    case MetaObj::Struct:
      Structure(static_cast<const MetaStruct&>(*root), 0, /*atRoot=*/true);
      break;
    case MetaObj::List: {
      const auto& list = static_cast<const MetaList&>(*root);
      if (IsPlainList(list)) {
        for (const MetaObjectPtr& item : list.GetItems()) {
          if (IsShown(item))
            lines_.push_back(ScalarText(*item));
        }
      } else {
        Blocks(list, 0, /*atRoot=*/true);
      }
      break;
    }
    case MetaObj::Boolean:
    case MetaObj::Integer:
    case MetaObj::String:
      lines_.push_back(ScalarText(*root));
      break;
    }
  }

  const std::vector<std::string>& Lines() const { return lines_; }

private:
  /// The lines of one structure block at \p indent, header first.
  void Structure(const MetaStruct& value, std::size_t indent, bool atRoot) {
    if (std::optional<std::string> header = HeaderLine(value, params_)) {
      lines_.push_back(std::string(indent, ' ') + *header);
      indent += IndentStep;
    }
    const std::string pad(indent, ' ');
    for (const MetaStruct::Field* field : SelectFields(value, params_, atRoot, Style::Simple)) {
      const MetaObjectPtr& item = field->value;
      if (!IsShown(item))
        continue;
      if (item->GetType() == MetaObj::Struct) {
        lines_.push_back(pad + field->name + ":");
        Structure(static_cast<const MetaStruct&>(*item), indent + IndentStep, false);
        continue;
      }
      if (item->GetType() == MetaObj::List && !IsPlainList(static_cast<const MetaList&>(*item))) {
        lines_.push_back(pad + field->name + ":");
        Blocks(static_cast<const MetaList&>(*item), indent + IndentStep, false);
        continue;
      }
      std::string text = WithUnit(CompactText(item, params_), value, field->name, params_);
      lines_.push_back(pad + field->name + ":" + (text.empty() ? "" : " " + text));
    }
  }

  /// The elements of a list of structures, one block each, with one blank
  /// line between blocks that have any lines.
  void Blocks(const MetaList& list, std::size_t indent, bool atRoot) {
    bool any = false;
    for (const MetaObjectPtr& item : list.GetItems()) {
      if (!IsShown(item))
        continue;
      const std::size_t start = lines_.size();
      if (any)
        lines_.emplace_back();
      const std::size_t first = lines_.size();
      if (item->GetType() == MetaObj::Struct)
        Structure(static_cast<const MetaStruct&>(*item), indent, atRoot);
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

class SimpleFormatter final : public Formatter {
public:
  void Write(std::ostream& out, const MetaObjectPtr& root,
             const Parameters& params) const override {
    WriteSimple(out, root, params);
  }
};

} // namespace

void WriteSimple(std::ostream& out, const MetaObjectPtr& root, const Parameters& params) {
  SimpleWriter writer(params);
  writer.Root(root);
  // The layout itself holds no control characters: any a line holds come
  // from stored text, which must neither forge lines nor reach the terminal.
  for (const std::string& line : writer.Lines())
    out << EscapeControls(line) << '\n';
}

std::unique_ptr<Formatter> MakeSimpleFormatter() {
  return std::make_unique<SimpleFormatter>();
}

} // namespace Fabrik::Format::Detail
