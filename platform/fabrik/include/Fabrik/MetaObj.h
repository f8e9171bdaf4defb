//===- Fabrik/MetaObj.h - Typed result values ------------------------------===//
//
// The typed values a command leaves in its output: booleans, integers,
// strings, structures with named fields and lists. The command host walks them
// to format a result; commands build them from the templates of their output
// specification.
//
// A scalar made without a value (MetaString::New()) is a template and counts as
// unset: formatters leave it out. SetField with a plain value always stores a
// set value.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace Fabrik::MetaObj {

/// Type codes of typed values; list elements use String (2) or Struct (3).
enum MetaType : int {
  Boolean = 0,
  Integer = 1,
  String = 2,
  Struct = 3,
  List = 4,
};

/// Base of every typed value.
class MetaObject {
public:
  virtual ~MetaObject() = default;
  virtual MetaType GetType() const = 0;
  /// False for a template value that was never given a value.
  virtual bool IsSet() const { return true; }
  /// A deep copy, so that a template can be filled without changing it.
  virtual std::shared_ptr<MetaObject> Clone() const = 0;
};

using MetaObjectPtr = std::shared_ptr<MetaObject>;

class MetaBool final : public MetaObject {
public:
  static std::shared_ptr<MetaBool> New() { return std::make_shared<MetaBool>(false, false); }
  static std::shared_ptr<MetaBool> New(bool value) {
    return std::make_shared<MetaBool>(value, true);
  }
  MetaBool(bool value, bool set) : value_(value), set_(set) {}
  MetaType GetType() const override { return Boolean; }
  bool IsSet() const override { return set_; }
  MetaObjectPtr Clone() const override { return std::make_shared<MetaBool>(*this); }
  bool GetValue() const { return value_; }

private:
  bool value_; ///< The value.
  bool set_;   ///< Whether a value was given.
};

class MetaInt final : public MetaObject {
public:
  static std::shared_ptr<MetaInt> New() { return std::make_shared<MetaInt>(0, false); }
  static std::shared_ptr<MetaInt> New(long value) { return std::make_shared<MetaInt>(value, true); }
  MetaInt(long value, bool set) : value_(value), set_(set) {}
  MetaType GetType() const override { return Integer; }
  bool IsSet() const override { return set_; }
  MetaObjectPtr Clone() const override { return std::make_shared<MetaInt>(*this); }
  long GetValue() const { return value_; }

private:
  long value_; ///< The value.
  bool set_;   ///< Whether a value was given.
};

class MetaString final : public MetaObject {
public:
  static std::shared_ptr<MetaString> New() { return std::make_shared<MetaString>("", false); }
  static std::shared_ptr<MetaString> New(std::string value) {
    return std::make_shared<MetaString>(std::move(value), true);
  }
  MetaString(std::string value, bool set) : value_(std::move(value)), set_(set) {}
  MetaType GetType() const override { return String; }
  bool IsSet() const override { return set_; }
  MetaObjectPtr Clone() const override { return std::make_shared<MetaString>(*this); }
  const std::string& GetValue() const { return value_; }

private:
  std::string value_; ///< The value.
  bool set_;          ///< Whether a value was given.
};

class MetaList final : public MetaObject {
public:
  /// A list of strings (type 2) or of structures (type 3); \p element is the
  /// structure template of a structure list.
  static std::shared_ptr<MetaList> New(MetaType type, MetaObjectPtr element = nullptr) {
    return std::make_shared<MetaList>(type, std::move(element));
  }
  MetaList(MetaType type, MetaObjectPtr element) : type_(type), element_(std::move(element)) {}
  MetaType GetType() const override { return List; }
  MetaObjectPtr Clone() const override;
  /// The type code of the elements.
  MetaType GetElementType() const { return type_; }
  /// The element template (structure lists), or null.
  const MetaObjectPtr& GetElementTemplate() const { return element_; }
  void Add(MetaObjectPtr value) { items_.push_back(std::move(value)); }
  void Add(std::string value);
  void AddAll(const std::vector<std::string>& values);
  void AddAll(const std::vector<MetaObjectPtr>& values);
  void Reserve(std::size_t count) { items_.reserve(count); }
  std::size_t GetCount() const { return items_.size(); }
  const std::vector<MetaObjectPtr>& GetItems() const { return items_; }

private:
  MetaType type_;                    ///< Type code of the elements.
  MetaObjectPtr element_;            ///< Element template, for structure lists.
  std::vector<MetaObjectPtr> items_; ///< The elements, in order.
};

class MetaStruct final : public MetaObject {
public:
  struct Field {
    std::string name;    ///< Field name, as shown to the user.
    MetaObjectPtr value; ///< Current value (possibly an unset template).
  };

  static std::shared_ptr<MetaStruct> New(std::string name) {
    return std::make_shared<MetaStruct>(std::move(name));
  }
  explicit MetaStruct(std::string name) : name_(std::move(name)) {}
  MetaType GetType() const override { return Struct; }
  MetaObjectPtr Clone() const override;
  const std::string& GetName() const { return name_; }

  /// Sets a field: replaces the value of an existing field in place, or
  /// appends a new field at the end.
  void SetField(const std::string& name, MetaObjectPtr value);
  void SetField(const std::string& name, const char* value);
  void SetField(const std::string& name, const std::string& value);
  void SetField(const std::string& name, bool value);
  void SetField(const std::string& name, int value);
  void SetField(const std::string& name, long value);
  void SetField(const std::string& name, const std::vector<std::string>& value);

  /// The field of that name, or null.
  const MetaObjectPtr* GetField(const std::string& name) const;
  const std::vector<Field>& GetFields() const { return fields_; }

private:
  std::string name_;          ///< Structure name.
  std::vector<Field> fields_; ///< Fields in declaration order.
};

} // namespace Fabrik::MetaObj
