//===- MetaObj.cpp - Typed result values ------------------------------------===//
//
// Values held in place, the shared layouts of structures, deep copies, the
// convenience setters that store plain C++ values, and the hand-over of a
// streamed list's rows.
//
//===----------------------------------------------------------------------===//
#include "Fabrik/MetaObj.h"

#include <algorithm>
#include <stdexcept>
#include <unordered_map>

namespace Fabrik::MetaObj {

namespace {

/// The request of StreamRows: rows of lists with this element layout go to
/// the sink, for the first such list made.
struct StreamRequest {
  const MetaLayout* layout = nullptr; ///< Element layout asked for, or null.
  RowSink* sink = nullptr;            ///< Where the rows go.
};

StreamRequest& Request() {
  static StreamRequest request;
  return request;
}

} // namespace

std::shared_ptr<MetaBool> MetaBool::New() {
  static const auto unset = std::make_shared<MetaBool>(false, false);
  return unset;
}

std::shared_ptr<MetaInt> MetaInt::New() {
  static const auto unset = std::make_shared<MetaInt>(0, false);
  return unset;
}

std::shared_ptr<MetaString> MetaString::New() {
  static const auto unset = std::make_shared<MetaString>("", false);
  return unset;
}

// MetaValue

MetaValue::MetaValue(const MetaObjectPtr& object) {
  Assign(object);
}

const MetaStruct& MetaValue::AsStruct() const {
  return static_cast<const MetaStruct&>(*object_);
}

const MetaList& MetaValue::AsList() const {
  return static_cast<const MetaList&>(*object_);
}

void MetaValue::SetScalar(MetaType type, long number) {
  type_ = type;
  null_ = false;
  set_ = true;
  number_ = number;
  object_.reset();
}

void MetaValue::Assign(const char* text, std::size_t length) {
  SetScalar(String, 0);
  text_.assign(text, length);
}

void MetaValue::Assign(std::string&& text) {
  SetScalar(String, 0);
  text_ = std::move(text);
}

void MetaValue::Assign(const MetaObjectPtr& object) {
  if (!object) {
    *this = MetaValue();
    return;
  }
  type_ = object->GetType();
  null_ = false;
  set_ = object->IsSet();
  number_ = 0;
  text_.clear();
  object_.reset();
  switch (type_) {
  case Boolean:
    number_ = static_cast<const MetaBool&>(*object).GetValue() ? 1 : 0;
    break;
  case Integer:
    number_ = static_cast<const MetaInt&>(*object).GetValue();
    break;
  case String:
    text_ = static_cast<const MetaString&>(*object).GetValue();
    break;
  case Struct:
  case List:
    object_ = object;
    break;
  }
}

MetaObjectPtr MetaValue::ToObject() const {
  if (null_)
    return nullptr;
  switch (type_) {
  case Boolean:
    return set_ ? MetaBool::New(GetBool()) : MetaBool::New();
  case Integer:
    return set_ ? MetaInt::New(number_) : MetaInt::New();
  case String:
    return set_ ? MetaString::New(text_) : MetaString::New();
  case Struct:
  case List:
    break;
  }
  return object_;
}

MetaValue MetaValue::Clone() const {
  MetaValue copy = *this;
  if (object_)
    copy.object_ = object_->Clone();
  return copy;
}

// MetaLayout

std::size_t MetaLayout::Find(const std::string& name) const {
  for (std::size_t i = 0; i < fields_.size(); ++i)
    if (fields_[i] == name)
      return i;
  return npos;
}

const MetaLayout* MetaLayout::Root(const std::string& name) {
  // Never freed: structures may live until the process ends, and the
  // number of kinds is fixed by the code that makes them.
  static auto* roots = new std::unordered_map<std::string, std::unique_ptr<MetaLayout>>();
  std::unique_ptr<MetaLayout>& root = (*roots)[name];
  if (!root)
    root = std::make_unique<MetaLayout>(name);
  return root.get();
}

const MetaLayout* MetaLayout::Extend(const std::string& name) const {
  for (const std::unique_ptr<MetaLayout>& longer : longer_)
    if (longer->fields_.back() == name)
      return longer.get();
  auto longer = std::make_unique<MetaLayout>(name_);
  longer->fields_.reserve(fields_.size() + 1);
  longer->fields_ = fields_;
  longer->fields_.push_back(name);
  longer->root_ = root_;
  root_->widest_ = std::max(root_->widest_, longer->fields_.size());
  longer_.push_back(std::move(longer));
  return longer_.back().get();
}

// MetaList

RowSink::~RowSink() = default;

MetaList::MetaList(MetaType type, MetaObjectPtr element)
    : type_(type), element_(std::move(element)) {
  StreamRequest& request = Request();
  if (request.layout && type_ == Struct && element_ && element_->GetType() == Struct &&
      &static_cast<const MetaStruct&>(*element_).GetLayout() == request.layout) {
    sink_ = request.sink;
    request = StreamRequest();
  }
}

MetaList::~MetaList() = default;

MetaObjectPtr MetaList::Clone() const {
  auto copy = std::make_shared<MetaList>(type_, element_ ? element_->Clone() : nullptr);
  copy->items_.reserve(items_.size());
  for (const MetaValue& item : items_)
    copy->items_.push_back(item.Clone());
  copy->count_ = count_;
  return copy;
}

void MetaList::Flush() {
  if (!pending_)
    return;
  // Taken first: a sink that throws leaves no row to hand over twice.
  MetaObjectPtr row = std::move(pending_);
  pending_.reset();
  sink_->Row(static_cast<const MetaStruct&>(*row));
}

void MetaList::Add(MetaObjectPtr value) {
  if (sink_) {
    // A streamed list is a list of structures; anything else in it could
    // not be shown where it belongs.
    if (!value || value->GetType() != Struct)
      throw std::logic_error("a streamed list of structures takes structures only");
    Flush();
    pending_ = std::move(value);
  } else {
    items_.emplace_back(value);
  }
  ++count_;
}

void MetaList::Add(std::string value) {
  if (sink_)
    throw std::logic_error("a streamed list of structures takes structures only");
  items_.emplace_back(std::move(value));
  ++count_;
}

void MetaList::AddAll(const std::vector<std::string>& values) {
  items_.reserve(items_.size() + values.size());
  for (const std::string& value : values)
    Add(value);
}

void MetaList::AddAll(const std::vector<MetaObjectPtr>& values) {
  if (!sink_)
    items_.reserve(items_.size() + values.size());
  for (const MetaObjectPtr& value : values)
    Add(value);
}

void MetaList::Reserve(std::size_t count) {
  if (!sink_)
    items_.reserve(count);
}

void StreamRows(const MetaStruct* element, RowSink* sink) {
  Request() = element && sink ? StreamRequest{&element->GetLayout(), sink} : StreamRequest();
}

// MetaStruct

MetaStruct::MetaStruct(const std::string& name) : layout_(MetaLayout::Root(name)) {
  // One allocation for the fields of a structure of a known kind.
  values_.reserve(layout_->GetWidest());
}

MetaObjectPtr MetaStruct::Clone() const {
  auto copy = std::make_shared<MetaStruct>(*this);
  for (MetaValue& value : copy->values_)
    if (value.GetObject())
      value = value.Clone();
  return copy;
}

MetaValue& MetaStruct::Slot(const std::string& name) {
  const std::vector<std::string>& names = layout_->GetFieldNames();
  for (std::size_t i = 0; i < values_.size(); ++i)
    if (names[i] == name)
      return values_[i];
  layout_ = layout_->Extend(name);
  return values_.emplace_back();
}

void MetaStruct::SetField(const std::string& name, MetaObjectPtr value) {
  Slot(name).Assign(value);
}

void MetaStruct::SetField(const std::string& name, const char* value) {
  if (value)
    Slot(name).Assign(value, std::char_traits<char>::length(value));
  else
    Slot(name).Assign(std::string());
}

void MetaStruct::SetField(const std::string& name, const std::string& value) {
  Slot(name).Assign(value);
}

void MetaStruct::SetField(const std::string& name, std::string&& value) {
  Slot(name).Assign(std::move(value));
}

void MetaStruct::SetField(const std::string& name, bool value) {
  Slot(name).Assign(value);
}

void MetaStruct::SetField(const std::string& name, int value) {
  Slot(name).Assign(static_cast<long>(value));
}

void MetaStruct::SetField(const std::string& name, long value) {
  Slot(name).Assign(value);
}

void MetaStruct::SetField(const std::string& name, const std::vector<std::string>& value) {
  auto list = MetaList::New(String);
  list->AddAll(value);
  Slot(name).Assign(MetaObjectPtr(std::move(list)));
}

const MetaValue* MetaStruct::GetField(const std::string& name) const {
  const std::size_t index = layout_->Find(name);
  return index == MetaLayout::npos ? nullptr : &values_[index];
}

} // namespace Fabrik::MetaObj
