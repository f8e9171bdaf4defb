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
// Structures and lists hold their scalars in place (MetaValue): setting a
// field to a number or a short string allocates nothing. The field names of a
// structure live in a layout (MetaLayout) that every structure of the same
// name and fields shares for the life of the process, so the rows of a
// listing carry no names of their own. Typed values are built and read on one
// thread at a time.
//
// A list may stream: when the command host has asked for the rows of the
// result's list (StreamRows), the first list of structures made with that
// element layout hands each row to the host's sink as the next one is added,
// or when the host asks (MetaList::Flush), instead of keeping it.
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
  /// An unset template; every call returns the same immutable value.
  static std::shared_ptr<MetaBool> New();
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
  /// An unset template; every call returns the same immutable value.
  static std::shared_ptr<MetaInt> New();
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
  /// An unset template; every call returns the same immutable value.
  static std::shared_ptr<MetaString> New();
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

class MetaStruct;
class MetaList;

/// One value in a structure's field or a list's item: a scalar held in place,
/// or a shared structure or list. A default-made value is null (no value).
class MetaValue {
public:
  MetaValue() = default;
  explicit MetaValue(bool value)
      : type_(Boolean), null_(false), set_(true), number_(value ? 1 : 0) {}
  explicit MetaValue(long value) : type_(Integer), null_(false), set_(true), number_(value) {}
  explicit MetaValue(std::string value)
      : type_(String), null_(false), set_(true), text_(std::move(value)) {}
  /// The value of \p object: a scalar is copied in place (set or not), a
  /// structure or list is shared, null stays null.
  explicit MetaValue(const MetaObjectPtr& object);

  /// True for no value at all (a null field or item).
  bool IsNull() const { return null_; }
  /// Present and, for a scalar, given a value: what the formatters show.
  bool IsShown() const { return !null_ && set_; }
  MetaType GetType() const { return type_; }
  bool GetBool() const { return number_ != 0; }
  long GetInt() const { return number_; }
  const std::string& GetString() const { return text_; }
  /// The structure or list, or null for a scalar.
  const MetaObjectPtr& GetObject() const { return object_; }
  /// The structure (GetType() == Struct) or list (List) held.
  const MetaStruct& AsStruct() const;
  const MetaList& AsList() const;
  /// A typed object of the value's own: a new scalar object, or the shared
  /// structure or list.
  MetaObjectPtr ToObject() const;
  /// A deep copy: structures and lists are cloned.
  MetaValue Clone() const;

  void Assign(bool value) { SetScalar(Boolean, value ? 1 : 0); }
  void Assign(long value) { SetScalar(Integer, value); }
  void Assign(const char* text, std::size_t length);
  void Assign(const std::string& text) { Assign(text.data(), text.size()); }
  void Assign(std::string&& text);
  void Assign(const MetaObjectPtr& object);

private:
  void SetScalar(MetaType type, long number);

  MetaType type_ = String; ///< Type of the value.
  bool null_ = true;       ///< No value at all.
  bool set_ = false;       ///< A scalar that was given a value; true for objects.
  long number_ = 0;        ///< Boolean (0 or 1) or integer value.
  std::string text_;       ///< String value.
  MetaObjectPtr object_;   ///< Structure or list value.
};

/// The name and field names of a kind of structure. Layouts are made once
/// per process and never change; structures of the same name that set the
/// same fields in the same order share one.
class MetaLayout {
public:
  const std::string& GetName() const { return name_; }
  const std::vector<std::string>& GetFieldNames() const { return fields_; }
  std::size_t GetFieldCount() const { return fields_.size(); }
  /// The index of field \p name, or npos.
  std::size_t Find(const std::string& name) const;

  /// The empty layout of structures named \p name.
  static const MetaLayout* Root(const std::string& name);
  /// This layout with field \p name added at the end.
  const MetaLayout* Extend(const std::string& name) const;
  /// The most fields any layout of this name has had so far.
  std::size_t GetWidest() const { return root_->widest_; }

  static constexpr std::size_t npos = static_cast<std::size_t>(-1);

  explicit MetaLayout(std::string name) : name_(std::move(name)) {}

private:
  std::string name_;                                        ///< Structure name.
  std::vector<std::string> fields_;                         ///< Field names, in order.
  mutable std::vector<std::unique_ptr<MetaLayout>> longer_; ///< Layouts one field longer.
  const MetaLayout* root_ = this;                           ///< The empty layout of the name.
  mutable std::size_t widest_ = 0;                          ///< Most fields under root_.
};

/// Receives the rows of a streamed list (MetaObj.h's header comment).
class RowSink {
public:
  virtual ~RowSink();
  /// One row, in order; \p row is not kept after the call.
  virtual void Row(const MetaStruct& row) = 0;
};

class MetaList final : public MetaObject {
public:
  /// A list of strings (type 2) or of structures (type 3); \p element is the
  /// structure template of a structure list.
  static std::shared_ptr<MetaList> New(MetaType type, MetaObjectPtr element = nullptr) {
    return std::make_shared<MetaList>(type, std::move(element));
  }
  MetaList(MetaType type, MetaObjectPtr element);
  ~MetaList() override;
  MetaList(const MetaList&) = delete;
  MetaList& operator=(const MetaList&) = delete;
  MetaType GetType() const override { return List; }
  MetaObjectPtr Clone() const override;
  /// The type code of the elements.
  MetaType GetElementType() const { return type_; }
  /// The element template (structure lists), or null.
  const MetaObjectPtr& GetElementTemplate() const { return element_; }
  void Add(MetaObjectPtr value);
  void Add(std::string value);
  void AddAll(const std::vector<std::string>& values);
  void AddAll(const std::vector<MetaObjectPtr>& values);
  void Reserve(std::size_t count);
  /// The number of items added, streamed ones included.
  std::size_t GetCount() const { return count_; }
  /// The items held; a streamed list holds none.
  const std::vector<MetaValue>& GetItems() const { return items_; }

  /// True when the rows go to the command host's sink.
  bool IsStreamed() const { return sink_ != nullptr; }
  /// Hands the last row added to the sink (it may be changed until the next
  /// Add or this call).
  void Flush();

private:
  MetaType type_;                ///< Type code of the elements.
  MetaObjectPtr element_;        ///< Element template, for structure lists.
  std::vector<MetaValue> items_; ///< The elements, in order.
  std::size_t count_ = 0;        ///< Items added.
  RowSink* sink_ = nullptr;      ///< Where rows go, when streamed.
  MetaObjectPtr pending_;        ///< The streamed row not yet handed over.
};

class MetaStruct final : public MetaObject {
public:
  static std::shared_ptr<MetaStruct> New(std::string name) {
    return std::make_shared<MetaStruct>(std::move(name));
  }
  explicit MetaStruct(const std::string& name);
  MetaType GetType() const override { return Struct; }
  MetaObjectPtr Clone() const override;
  const std::string& GetName() const { return layout_->GetName(); }

  /// Sets a field: replaces the value of an existing field in place, or
  /// appends a new field at the end.
  void SetField(const std::string& name, MetaObjectPtr value);
  void SetField(const std::string& name, const char* value);
  void SetField(const std::string& name, const std::string& value);
  void SetField(const std::string& name, std::string&& value);
  void SetField(const std::string& name, bool value);
  void SetField(const std::string& name, int value);
  void SetField(const std::string& name, long value);
  void SetField(const std::string& name, const std::vector<std::string>& value);

  /// The field of that name, or null.
  const MetaValue* GetField(const std::string& name) const;
  /// The names of the fields, in order, and the structure's name.
  const MetaLayout& GetLayout() const { return *layout_; }
  std::size_t GetFieldCount() const { return values_.size(); }
  const std::string& GetFieldName(std::size_t index) const {
    return layout_->GetFieldNames()[index];
  }
  const MetaValue& GetFieldValue(std::size_t index) const { return values_[index]; }

private:
  /// The value of field \p name, added at the end when missing.
  MetaValue& Slot(const std::string& name);

  const MetaLayout* layout_;      ///< Name and field names.
  std::vector<MetaValue> values_; ///< Field values, in layout order.
};

/// Asks for the rows of the next list of structures whose element template
/// has \p element's layout: they go to \p sink instead of the list. Null
/// stops asking. The command host calls this around a command's execution.
void StreamRows(const MetaStruct* element, RowSink* sink);

} // namespace Fabrik::MetaObj
