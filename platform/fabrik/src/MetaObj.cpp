//===- MetaObj.cpp - Typed result values ------------------------------------===//
//
// Deep copies of lists and structures, and the convenience setters that wrap
// plain C++ values into typed values.
//
//===----------------------------------------------------------------------===//
#include "Fabrik/MetaObj.h"

namespace Fabrik::MetaObj {

MetaObjectPtr MetaList::Clone() const {
  auto copy = std::make_shared<MetaList>(type_, element_ ? element_->Clone() : nullptr);
  copy->items_.reserve(items_.size());
  for (const MetaObjectPtr& item : items_)
    copy->items_.push_back(item ? item->Clone() : nullptr);
  return copy;
}

void MetaList::Add(std::string value) {
  items_.push_back(MetaString::New(std::move(value)));
}

void MetaList::AddAll(const std::vector<std::string>& values) {
  items_.reserve(items_.size() + values.size());
  for (const std::string& value : values)
    items_.push_back(MetaString::New(value));
}

void MetaList::AddAll(const std::vector<MetaObjectPtr>& values) {
  items_.insert(items_.end(), values.begin(), values.end());
}

MetaObjectPtr MetaStruct::Clone() const {
  auto copy = std::make_shared<MetaStruct>(name_);
  copy->fields_.reserve(fields_.size());
  for (const Field& field : fields_)
    copy->fields_.push_back({field.name, field.value ? field.value->Clone() : nullptr});
  return copy;
}

void MetaStruct::SetField(const std::string& name, MetaObjectPtr value) {
  for (Field& field : fields_) {
    if (field.name == name) {
      field.value = std::move(value);
      return;
    }
  }
  fields_.push_back({name, std::move(value)});
}

void MetaStruct::SetField(const std::string& name, const char* value) {
  SetField(name, MetaString::New(value ? std::string(value) : std::string()));
}

void MetaStruct::SetField(const std::string& name, const std::string& value) {
  SetField(name, MetaString::New(value));
}

void MetaStruct::SetField(const std::string& name, bool value) {
  SetField(name, MetaBool::New(value));
}

void MetaStruct::SetField(const std::string& name, int value) {
  SetField(name, MetaInt::New(static_cast<long>(value)));
}

void MetaStruct::SetField(const std::string& name, long value) {
  SetField(name, MetaInt::New(value));
}

void MetaStruct::SetField(const std::string& name, const std::vector<std::string>& value) {
  auto list = MetaList::New(String);
  list->AddAll(value);
  SetField(name, std::move(list));
}

const MetaObjectPtr* MetaStruct::GetField(const std::string& name) const {
  for (const Field& field : fields_) {
    if (field.name == name)
      return &field.value;
  }
  return nullptr;
}

} // namespace Fabrik::MetaObj
