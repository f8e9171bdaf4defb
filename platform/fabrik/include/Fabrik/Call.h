//===- Fabrik/Call.h - Parameter and result descriptions --------------===//
//
// What a command takes (InputSpec of ParameterSpecs, each with an optional
// ParameterConstraint) and what it gives (OutputSpec with a result template),
// and the per-invocation Input and Output objects.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/MetaObj.h"

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace Fabrik::CallSpec {

/// Type codes of parameters.
enum ParameterType : int {
  String = 0,
  Integer = 1,
  Boolean = 2,
  Flag = 3,
  StringList = 4,
};

/// Type codes of constraints.
enum ParameterConstraintType : int {
  IntRange = 1,
  IntEnum = 2,
  StringEnum = 3,
  StringRegex = 4,
};

/// A check on a parameter's value that also describes itself for help texts.
class ParameterConstraint {
public:
  struct EnumValue {
    std::string value;       ///< The accepted text (or decimal integer).
    std::string description; ///< Its description; may be empty.
  };

  static std::shared_ptr<ParameterConstraint> New(ParameterConstraintType type);
  explicit ParameterConstraint(ParameterConstraintType type);
  ~ParameterConstraint();
  ParameterConstraint(const ParameterConstraint&) = delete;
  ParameterConstraint& operator=(const ParameterConstraint&) = delete;

  void AddStringEnum(const std::string& value);
  void AddStringEnum(const std::string& value, const std::string& description);
  void AddIntEnum(long value);
  void SetIntRange(long min, long max);
  /// A pattern in ECMAScript syntax that the whole value must match.
  void SetStringRegex(const std::string& pattern);

  ParameterConstraintType GetType() const { return type_; }
  const std::vector<EnumValue>& GetEnumValues() const { return enums_; }
  long GetMin() const { return min_; }
  long GetMax() const { return max_; }
  const std::string& GetPattern() const { return pattern_; }

  /// The problem with \p value, or nothing when it is accepted.
  std::optional<std::string> CheckString(const std::string& value) const;
  std::optional<std::string> CheckInt(long value) const;

  /// Help texts: "%ENUM%" expands to the values joined by ", "; "%FULLENUM%" to
  /// one "value: description" entry per value.
  std::string EnumText() const;
  std::string FullEnumText() const;
  /// One line describing the constraint: "one of: a, b", "integer in
  /// [1 - 4096]" or "matches: <pattern>".
  std::string Describe() const;

private:
  struct Regex;
  ParameterConstraintType type_; ///< Kind of check.
  std::vector<EnumValue> enums_; ///< Accepted values of an enumeration.
  long min_ = 0;                 ///< Lower bound of a range, included.
  long max_ = 0;                 ///< Upper bound of a range, included.
  std::string pattern_;          ///< Pattern text of a regex constraint.
  std::unique_ptr<Regex> regex_; ///< Compiled on first use.
};

/// One parameter a command takes.
class ParameterSpec {
public:
  static std::shared_ptr<ParameterSpec> New(const std::string& name, ParameterType type);
  ParameterSpec(std::string name, ParameterType type) : name_(std::move(name)), type_(type) {}

  void SetShortName(const std::string& shortName) { shortName_ = shortName; }
  void SetDescription(const std::string& description) { description_ = description; }
  void SetRequired(bool required) { required_ = required; }
  void SetConstraint(std::shared_ptr<ParameterConstraint> constraint) {
    constraint_ = std::move(constraint);
  }

  const std::string& GetName() const { return name_; }
  ParameterType GetType() const { return type_; }
  const std::string& GetShortName() const { return shortName_; }
  const std::string& GetDescription() const { return description_; }
  bool IsRequired() const { return required_; }
  const std::shared_ptr<ParameterConstraint>& GetConstraint() const { return constraint_; }
  /// The description with %ENUM% and %FULLENUM% expanded.
  std::string GetExpandedDescription() const;

private:
  std::string name_;                                ///< Long name, such as "nic-name".
  ParameterType type_;                              ///< Value type.
  std::string shortName_;                           ///< One letter, or empty.
  std::string description_;                         ///< Help text.
  bool required_ = false;                           ///< Must be given.
  std::shared_ptr<ParameterConstraint> constraint_; ///< Optional check.
};

/// The parameters of a command, in declaration order.
class InputSpec {
public:
  static std::shared_ptr<InputSpec> New() { return std::make_shared<InputSpec>(); }
  void AddParameter(std::shared_ptr<ParameterSpec> parameter) {
    parameters_.push_back(std::move(parameter));
  }
  const std::vector<std::shared_ptr<ParameterSpec>>& GetParameters() const { return parameters_; }
  /// The parameter with that long name, or null.
  std::shared_ptr<ParameterSpec> FindParameter(const std::string& name) const;
  /// The parameter with that short name, or null.
  std::shared_ptr<ParameterSpec> FindShortParameter(const std::string& shortName) const;

private:
  std::vector<std::shared_ptr<ParameterSpec>> parameters_; ///< In declaration order.
};

/// The shape of a command's result.
class OutputSpec {
public:
  static std::shared_ptr<OutputSpec> New() { return std::make_shared<OutputSpec>(); }
  void SetRootObject(MetaObj::MetaObjectPtr root) { root_ = std::move(root); }
  const MetaObj::MetaObjectPtr& GetRootObject() const { return root_; }

private:
  MetaObj::MetaObjectPtr root_; ///< Result template.
};

/// The validated parameters of one invocation.
class Input {
public:
  static std::shared_ptr<Input> New() { return std::make_shared<Input>(); }

  /// Value setters used by the command host after validation. Each replaces
  /// an earlier value of the same parameter; the overloads with \p typed keep
  /// the text as the user typed it for GetParameter.
  void SetString(const std::string& name, std::string value);
  void SetInt(const std::string& name, long value);
  void SetInt(const std::string& name, long value, std::string typed);
  void SetBool(const std::string& name, bool value);
  void SetBool(const std::string& name, bool value, std::string typed);
  void SetFlag(const std::string& name);
  void AddListValue(const std::string& name, std::string value);

  /// The text of a string parameter (or the text as typed of any parameter).
  /// A parameter that was not given reads as empty, 0 or false.
  const std::string& GetParameter(const std::string& name) const;
  long GetParameterInt(const std::string& name) const;
  bool GetParameterBool(const std::string& name) const;
  /// Replaces the contents of \p values with the values given, in order.
  void GetParameterList(const std::string& name, std::vector<std::string>& values) const;
  bool IsFlagSet(const std::string& name) const;
  bool HasParameter(const std::string& name) const;

private:
  struct Value {
    std::string text;              ///< The text as typed (strings, integers, booleans).
    long number = 0;               ///< Integer value.
    bool boolean = false;          ///< Boolean or flag value.
    std::vector<std::string> list; ///< String-list values.
  };
  const Value& Find(const std::string& name) const;
  std::map<std::string, Value> values_; ///< By long name.
};

/// What a command leaves: a root object and error messages.
class Output {
public:
  static std::shared_ptr<Output> New() { return std::make_shared<Output>(); }
  void SetRootObject(MetaObj::MetaObjectPtr root) { root_ = std::move(root); }
  const MetaObj::MetaObjectPtr& GetRootObject() const { return root_; }
  void AddErrorMessage(const std::string& message) { errors_.push_back(message); }
  bool HasError() const { return !errors_.empty(); }
  const std::vector<std::string>& GetErrorMessages() const { return errors_; }

private:
  MetaObj::MetaObjectPtr root_;     ///< Result, or null.
  std::vector<std::string> errors_; ///< In the order added.
};

} // namespace Fabrik::CallSpec
