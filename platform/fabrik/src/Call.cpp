//===- Call.cpp - Parameter and result descriptions ---------------------===//
//
// Constraint checks and their help texts, parameter look-up and the reading
// of validated parameter values.
//
//===----------------------------------------------------------------------===//
#include "Fabrik/Call.h"

#include <cctype>
#include <cerrno>
#include <cstdlib>
#include <mutex>
#include <regex>

namespace Fabrik::CallSpec {

namespace {

/// Longest value a pattern is matched against. The standard library's regex
/// engine recurses once per repeated character, so a very long value could
/// exhaust the stack; no parameter of the tree comes close to this length.
constexpr std::size_t MaxRegexInput = 4096;

/// Parses \p text as a whole decimal integer with an optional sign.
std::optional<long> ParseLong(const std::string& text) {
  if (text.empty())
    return std::nullopt;
  const char* begin = text.c_str();
  char* end = nullptr;
  errno = 0;
  long value = std::strtol(begin, &end, 10);
  // strtol skips leading blanks; a value as typed must not have any.
  if (errno == ERANGE || end != begin + text.size() ||
      std::isspace(static_cast<unsigned char>(*begin)))
    return std::nullopt;
  return value;
}

std::string RangeText(long min, long max) {
  return "[" + std::to_string(min) + " - " + std::to_string(max) + "]";
}

} // namespace

/// The compiled form of a pattern. It is created with the pattern and
/// compiled on first use, once, even when several threads check at once.
struct ParameterConstraint::Regex {
  explicit Regex(std::string text) : pattern(std::move(text)) {}

  /// The compiled pattern, or null when the pattern is not valid.
  const std::regex* Get() {
    std::call_once(once, [this] {
      try {
        compiled.emplace(pattern, std::regex::ECMAScript);
      } catch (const std::regex_error&) {
        compiled.reset();
      }
    });
    return compiled ? &*compiled : nullptr;
  }

  std::string pattern;                ///< Pattern text.
  std::once_flag once;                ///< Guards the compilation.
  std::optional<std::regex> compiled; ///< Set once compiled successfully.
};

std::shared_ptr<ParameterConstraint> ParameterConstraint::New(ParameterConstraintType type) {
  return std::make_shared<ParameterConstraint>(type);
}

ParameterConstraint::ParameterConstraint(ParameterConstraintType type) : type_(type) {}

ParameterConstraint::~ParameterConstraint() = default;

void ParameterConstraint::AddStringEnum(const std::string& value) {
  enums_.push_back({value, ""});
}

void ParameterConstraint::AddStringEnum(const std::string& value, const std::string& description) {
  enums_.push_back({value, description});
}

void ParameterConstraint::AddIntEnum(long value) {
  enums_.push_back({std::to_string(value), ""});
}

void ParameterConstraint::SetIntRange(long min, long max) {
  min_ = min;
  max_ = max;
}

void ParameterConstraint::SetStringRegex(const std::string& pattern) {
  pattern_ = pattern;
  regex_ = std::make_unique<Regex>(pattern);
}

std::optional<std::string> ParameterConstraint::CheckString(const std::string& value) const {
  switch (type_) {
  case IntRange:
  case IntEnum: {
    std::optional<long> number = ParseLong(value);
    if (!number)
      return "value \"" + value + "\" is not an integer";
    return CheckInt(*number);
  }
  case StringEnum:
    for (const EnumValue& accepted : enums_) {
      if (accepted.value == value)
        return std::nullopt;
    }
    return "value \"" + value + "\" is not one of: " + EnumText();
  case StringRegex: {
    const std::regex* regex = regex_ ? regex_->Get() : nullptr;
    if (!regex)
      return "value \"" + value + "\" cannot be checked: the pattern " + pattern_ +
             " is not a valid regular expression";
    if (value.size() > MaxRegexInput)
      return "value is too long (" + std::to_string(value.size()) + " characters, at most " +
             std::to_string(MaxRegexInput) + ") to match the pattern " + pattern_;
    if (std::regex_match(value, *regex))
      return std::nullopt;
    return "value \"" + value + "\" does not match the pattern " + pattern_;
  }
  }
  return "value \"" + value + "\" cannot be checked: unknown constraint type " +
         std::to_string(static_cast<int>(type_));
}

std::optional<std::string> ParameterConstraint::CheckInt(long value) const {
  switch (type_) {
  case IntRange:
    if (value < min_ || value > max_)
      return "value " + std::to_string(value) + " is out of range " + RangeText(min_, max_);
    return std::nullopt;
  case IntEnum: {
    const std::string text = std::to_string(value);
    for (const EnumValue& accepted : enums_) {
      if (accepted.value == text)
        return std::nullopt;
    }
    return "value " + text + " is not one of: " + EnumText();
  }
  case StringEnum:
  case StringRegex:
    return CheckString(std::to_string(value));
  }
  return "value " + std::to_string(value) + " cannot be checked: unknown constraint type " +
         std::to_string(static_cast<int>(type_));
}

// Help texts. For an enumeration, EnumText is "a, b, c" and FullEnumText puts
// each value on a line of its own, indented by four blanks, after a line
// break (the text it expands into usually ends with a colon):
//
//   "\n    tp: Select TP ...\n    aui: Select AUI ..."
//
// A value without a description is shown alone ("\n    10"). There is no line
// break after the last value. A range reads "[1 - 4096]" and a pattern reads
// as its own text, in both forms.

std::string ParameterConstraint::EnumText() const {
  switch (type_) {
  case IntRange:
    return RangeText(min_, max_);
  case StringRegex:
    return pattern_;
  case IntEnum:
  case StringEnum:
    break;
  }
  std::string text;
  for (const EnumValue& accepted : enums_) {
    if (!text.empty())
      text += ", ";
    text += accepted.value;
  }
  return text;
}

std::string ParameterConstraint::FullEnumText() const {
  if (type_ != IntEnum && type_ != StringEnum)
    return EnumText();
  std::string text;
  for (const EnumValue& accepted : enums_) {
    text += "\n    ";
    text += accepted.value;
    if (!accepted.description.empty()) {
      text += ": ";
      text += accepted.description;
    }
  }
  return text;
}

std::string ParameterConstraint::Describe() const {
  switch (type_) {
  case IntRange:
    return "integer in " + RangeText(min_, max_);
  case StringRegex:
    return "matches: " + pattern_;
  case IntEnum:
  case StringEnum:
    return "one of: " + EnumText();
  }
  return "";
}

std::shared_ptr<ParameterSpec> ParameterSpec::New(const std::string& name, ParameterType type) {
  return std::make_shared<ParameterSpec>(name, type);
}

std::string ParameterSpec::GetExpandedDescription() const {
  static const std::string EnumToken = "%ENUM%";
  static const std::string FullEnumToken = "%FULLENUM%";
  // One pass from left to right, so that text inserted for a token is never
  // itself searched for tokens.
  std::string text;
  text.reserve(description_.size());
  std::size_t pos = 0;
  while (pos < description_.size()) {
    if (description_.compare(pos, EnumToken.size(), EnumToken) == 0) {
      if (constraint_)
        text += constraint_->EnumText();
      pos += EnumToken.size();
    } else if (description_.compare(pos, FullEnumToken.size(), FullEnumToken) == 0) {
      if (constraint_)
        text += constraint_->FullEnumText();
      pos += FullEnumToken.size();
    } else {
      text += description_[pos++];
    }
  }
  return text;
}

std::shared_ptr<ParameterSpec> InputSpec::FindParameter(const std::string& name) const {
  for (const auto& parameter : parameters_) {
    if (parameter->GetName() == name)
      return parameter;
  }
  return nullptr;
}

std::shared_ptr<ParameterSpec> InputSpec::FindShortParameter(const std::string& shortName) const {
  if (shortName.empty())
    return nullptr;
  for (const auto& parameter : parameters_) {
    if (parameter->GetShortName() == shortName)
      return parameter;
  }
  return nullptr;
}

void Input::SetString(const std::string& name, std::string value) {
  Value& stored = values_[name] = Value();
  stored.text = std::move(value);
}

void Input::SetInt(const std::string& name, long value) {
  SetInt(name, value, std::to_string(value));
}

void Input::SetInt(const std::string& name, long value, std::string typed) {
  Value& stored = values_[name] = Value();
  stored.text = std::move(typed);
  stored.number = value;
}

void Input::SetBool(const std::string& name, bool value) {
  SetBool(name, value, value ? "true" : "false");
}

void Input::SetBool(const std::string& name, bool value, std::string typed) {
  Value& stored = values_[name] = Value();
  stored.text = std::move(typed);
  stored.boolean = value;
}

void Input::SetFlag(const std::string& name) {
  Value& stored = values_[name] = Value();
  stored.boolean = true;
}

void Input::AddListValue(const std::string& name, std::string value) {
  values_[name].list.push_back(std::move(value));
}

const Input::Value& Input::Find(const std::string& name) const {
  static const Value Absent;
  auto it = values_.find(name);
  return it == values_.end() ? Absent : it->second;
}

const std::string& Input::GetParameter(const std::string& name) const {
  return Find(name).text;
}

long Input::GetParameterInt(const std::string& name) const {
  return Find(name).number;
}

bool Input::GetParameterBool(const std::string& name) const {
  return Find(name).boolean;
}

void Input::GetParameterList(const std::string& name, std::vector<std::string>& values) const {
  values = Find(name).list;
}

bool Input::IsFlagSet(const std::string& name) const {
  return Find(name).boolean;
}

bool Input::HasParameter(const std::string& name) const {
  return values_.count(name) != 0;
}

} // namespace Fabrik::CallSpec
