//===- ParameterTable.h - Parameters of a command declared as a table -----===//
//
// Every command declares its parameters as rows of ParameterDef, in the order
// it takes them, and builds its input specification with MakeInputSpec. A row
// holds the long and short name, the type, whether the parameter is required,
// the description and the check on its values (a range, an enumeration of
// strings or integers, or a pattern), so that each of them is written once.
//
// The rows are literal values: a family keeps its tables as constants at file
// level without running code when the plug-in loads. The texts are referred
// to, not copied, until MakeInputSpec builds the parameters: a row may name a
// file-level std::string constant, a literal, or a string that lives until
// MakeInputSpec returns.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"

#include <initializer_list>
#include <memory>
#include <span>
#include <string>
#include <string_view>

namespace CorvexCli::NetworkNamespace {

/// A text a table row refers to: a literal or a std::string constant. The
/// string is read when MakeInputSpec builds the parameters, so a row may name a
/// constant of another file whatever the order in which files initialize.
class TextRef {
public:
  constexpr TextRef() = default;
  constexpr TextRef(const char* literal) : literal_(literal) {}
  constexpr TextRef(const std::string& text) : text_(&text) {}
  std::string_view View() const { return text_ ? std::string_view(*text_) : literal_; }

private:
  std::string_view literal_;          ///< The literal, when no string is named.
  const std::string* text_ = nullptr; ///< The string named, if any.
};

/// One accepted value of an enumeration and what it means ("" for nothing).
struct EnumChoice {
  TextRef value;            ///< The accepted text.
  TextRef description = {}; ///< Its description in %FULLENUM%, if any.
};

/// The check a parameter's values are held to; a default value checks nothing.
struct ParameterCheck {
  /// Kind of check: 0 for none, else one of the framework's constraint types.
  int kind = 0;
  long min = 0;                        ///< Lowest accepted integer (Range).
  long max = 0;                        ///< Highest accepted integer (Range).
  TextRef pattern;                     ///< ECMAScript pattern of the whole value.
  std::span<const EnumChoice> choices; ///< Accepted strings, in help order.
  std::span<const long> integers;      ///< Accepted integers, in help order.

  /// Integers from \p min to \p max, both included.
  static constexpr ParameterCheck Range(long min, long max) {
    return {Fabrik::CallSpec::IntRange, min, max, {}, {}, {}};
  }
  /// One of \p choices.
  static constexpr ParameterCheck OneOf(std::span<const EnumChoice> choices) {
    return {Fabrik::CallSpec::StringEnum, 0, 0, {}, choices, {}};
  }
  /// One of \p integers.
  static constexpr ParameterCheck OneOfIntegers(std::span<const long> integers) {
    return {Fabrik::CallSpec::IntEnum, 0, 0, {}, {}, integers};
  }
  /// A value that matches \p pattern as a whole.
  static constexpr ParameterCheck Matching(TextRef pattern) {
    return {Fabrik::CallSpec::StringRegex, 0, 0, pattern, {}, {}};
  }
};

/// One parameter of a command.
struct ParameterDef {
  TextRef name;                         ///< Long name.
  TextRef shortName;                    ///< One letter, or "" for none.
  Fabrik::CallSpec::ParameterType type; ///< Value type.
  bool required;                        ///< Must be given.
  TextRef description;                  ///< Help text, with %ENUM% or %FULLENUM%.
  ParameterCheck check = {};            ///< Check on its values.
};

/// Appends one parameter per row of \p table to \p spec, in order.
void AddParameters(Fabrik::CallSpec::InputSpec& spec, std::span<const ParameterDef> table);
void AddParameters(Fabrik::CallSpec::InputSpec& spec, std::initializer_list<ParameterDef> table);

/// A new input specification holding the rows of \p table, in order.
std::shared_ptr<Fabrik::CallSpec::InputSpec> MakeInputSpec(std::span<const ParameterDef> table);
std::shared_ptr<Fabrik::CallSpec::InputSpec>
MakeInputSpec(std::initializer_list<ParameterDef> table);

} // namespace CorvexCli::NetworkNamespace
