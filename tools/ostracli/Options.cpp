//===- Options.cpp - Command options against an input specification ------===//
#include "Options.h"

#include "Globals.h"
#include "Help.h"

#include <cerrno>
#include <cstdlib>
#include <set>

namespace Ostra {

using namespace Fabrik::CallSpec;

bool ParseBoolWord(const std::string& text, bool& value) {
  std::string word;
  for (char c : text)
    word += static_cast<char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
  if (word == "true" || word == "1" || word == "yes" || word == "on") {
    value = true;
    return true;
  }
  if (word == "false" || word == "0" || word == "no" || word == "off") {
    value = false;
    return true;
  }
  return false;
}

bool ParseInteger(const std::string& text, long& value) {
  std::size_t start = 0;
  if (!text.empty() && (text[0] == '-' || text[0] == '+'))
    start = 1;
  if (start >= text.size() || text.size() - start > 20)
    return false;
  for (std::size_t i = start; i < text.size(); ++i)
    if (text[i] < '0' || text[i] > '9')
      return false;
  errno = 0;
  char* end = nullptr;
  long long parsed = std::strtoll(text.c_str(), &end, 10);
  if (errno == ERANGE || *end != '\0')
    return false;
  value = static_cast<long>(parsed);
  return true;
}

namespace {

/// No parameter of any command needs a longer text; refusing longer ones here
/// keeps unbounded input away from every command and from the host state.
constexpr std::size_t kMaxValueBytes = 4096;

std::string OptionName(const ParameterSpec& spec) {
  return "--" + spec.GetName();
}

/// Whether \p text is well-formed UTF-8 (no overlong forms, surrogates or
/// code points above U+10FFFF).
bool IsUtf8(const std::string& text) {
  const auto* p = reinterpret_cast<const unsigned char*>(text.data());
  const auto* end = p + text.size();
  while (p < end) {
    unsigned c = *p++;
    if (c < 0x80)
      continue;
    int more;
    unsigned min;
    if ((c & 0xe0) == 0xc0) {
      more = 1;
      min = 0x80;
      c &= 0x1f;
    } else if ((c & 0xf0) == 0xe0) {
      more = 2;
      min = 0x800;
      c &= 0x0f;
    } else if ((c & 0xf8) == 0xf0) {
      more = 3;
      min = 0x10000;
      c &= 0x07;
    } else {
      return false;
    }
    if (end - p < more)
      return false;
    for (int i = 0; i < more; ++i) {
      if ((p[i] & 0xc0) != 0x80)
        return false;
      c = (c << 6) | (p[i] & 0x3f);
    }
    p += more;
    if (c < min || c > 0x10ffff || (c >= 0xd800 && c <= 0xdfff))
      return false;
  }
  return true;
}

std::string Quote(const std::string& text) {
  // Keeps messages readable for long or binary input: at most 64 bytes, cut
  // before a character that would not fit whole, and control bytes escaped.
  // Text that is not UTF-8 has every byte above 0x7f escaped as well, so that
  // the message itself stays valid UTF-8.
  std::size_t cut = text.size();
  if (cut > 64) {
    cut = 64;
    while (cut > 0 && (static_cast<unsigned char>(text[cut]) & 0xc0) == 0x80)
      --cut;
  }
  std::string shown = text.substr(0, cut);
  const bool utf8 = IsUtf8(shown);
  std::string out = "\"";
  for (unsigned char c : shown) {
    if (c < 0x20 || c == 0x7f || (c >= 0x80 && !utf8)) {
      static const char hex[] = "0123456789abcdef";
      out += "\\x";
      out += hex[c >> 4];
      out += hex[c & 15];
    } else {
      out += static_cast<char>(c);
    }
  }
  return out + (cut < text.size() ? "...\"" : "\"");
}

/// Whether \p text is a decimal integer, however large.
bool IsDecimal(const std::string& text) {
  std::size_t start = !text.empty() && (text[0] == '-' || text[0] == '+') ? 1 : 0;
  if (start >= text.size())
    return false;
  for (std::size_t i = start; i < text.size(); ++i)
    if (text[i] < '0' || text[i] > '9')
      return false;
  return true;
}

/// "unknown option X" with the command's closest options, or the reminder
/// that a global option goes before the command words.
std::string UnknownOption(const InputSpec& spec, const std::string& option) {
  if (FindGlobalOption(option))
    return "option " + option + " is a global option; global options go before the command words";
  if (option.compare(0, 2, "--") != 0)
    return "unknown option " + option;
  std::vector<std::string> names;
  for (const auto& parameter : spec.GetParameters())
    names.push_back(parameter->GetName());
  return "unknown option " + option + DidYouMean(ClosestNames(option.substr(2), names), "--", "");
}

bool Store(const ParameterSpec& spec, const std::string& value, Input& input,
           std::string& problem) {
  const std::string name = OptionName(spec);
  const auto& constraint = spec.GetConstraint();
  switch (spec.GetType()) {
  case Integer: {
    long number = 0;
    if (!ParseInteger(value, number)) {
      problem = "option " + name + ": " + Quote(value) +
                (IsDecimal(value) ? " is outside the 64-bit integer range" : " is not an integer");
      return false;
    }
    if (constraint) {
      if (auto bad = constraint->CheckInt(number)) {
        problem = "option " + name + ": " + *bad;
        return false;
      }
    }
    input.SetInt(spec.GetName(), number, value);
    return true;
  }
  case Boolean: {
    bool flag = false;
    if (!ParseBoolWord(value, flag)) {
      problem = "option " + name + ": " + Quote(value) +
                " is not a boolean (true/false, yes/no, on/off, 1/0)";
      return false;
    }
    input.SetBool(spec.GetName(), flag, value);
    return true;
  }
  case String:
  case StringList:
    if (value.size() > kMaxValueBytes) {
      problem = "option " + name + ": the value is longer than " + std::to_string(kMaxValueBytes) +
                " bytes";
      return false;
    }
    if (!IsUtf8(value)) {
      problem = "option " + name + ": the value is not valid UTF-8 text";
      return false;
    }
    if (constraint) {
      if (auto bad = constraint->CheckString(value)) {
        problem = "option " + name + ": " + *bad;
        return false;
      }
    }
    if (spec.GetType() == String)
      input.SetString(spec.GetName(), value);
    else
      input.AddListValue(spec.GetName(), value);
    return true;
  case Flag:
    input.SetFlag(spec.GetName());
    return true;
  }
  problem = "option " + name + " has an unknown type";
  return false;
}

} // namespace

bool AsksForHelp(const std::vector<std::string>& args, const InputSpec* spec) {
  for (const std::string& arg : args)
    if (arg == "--help" || (arg == "-h" && !(spec && spec->FindShortParameter("h"))))
      return true;
  return false;
}

bool ParseCommandOptions(const InputSpec& spec, const std::vector<std::string>& args, Input& input,
                         std::string& problem) {
  std::set<std::string> seen;
  for (std::size_t i = 0; i < args.size(); ++i) {
    const std::string& arg = args[i];
    std::shared_ptr<ParameterSpec> parameter;
    std::string value;
    bool hasValue = false;
    if (arg.size() > 2 && arg.compare(0, 2, "--") == 0) {
      std::size_t eq = arg.find('=');
      std::string name = arg.substr(2, eq == std::string::npos ? std::string::npos : eq - 2);
      parameter = spec.FindParameter(name);
      if (!parameter) {
        problem = UnknownOption(spec, "--" + name);
        return false;
      }
      if (eq != std::string::npos) {
        value = arg.substr(eq + 1);
        hasValue = true;
      }
    } else if (arg.size() == 2 && arg[0] == '-' && arg[1] != '-') {
      parameter = spec.FindShortParameter(arg.substr(1));
      if (!parameter) {
        problem = UnknownOption(spec, arg);
        return false;
      }
    } else {
      problem = "unexpected argument " + Quote(arg) + " (options are written --name VALUE)";
      return false;
    }
    const std::string name = OptionName(*parameter);
    if (parameter->GetType() == Flag) {
      if (hasValue) {
        problem = "option " + name + " takes no value";
        return false;
      }
    } else if (!hasValue) {
      if (i + 1 >= args.size()) {
        problem = "option " + name + " requires a value";
        return false;
      }
      value = args[++i];
    }
    if (parameter->GetType() != StringList && !seen.insert(parameter->GetName()).second) {
      problem = "option " + name + " is given more than once";
      return false;
    }
    if (!Store(*parameter, value, input, problem))
      return false;
  }
  for (const auto& parameter : spec.GetParameters()) {
    if (parameter->IsRequired() && !input.HasParameter(parameter->GetName())) {
      problem = "missing required option " + OptionName(*parameter) +
                (parameter->GetShortName().empty() ? "" : " (-" + parameter->GetShortName() + ")");
      return false;
    }
  }
  return true;
}

} // namespace Ostra
