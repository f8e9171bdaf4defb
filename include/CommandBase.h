//===- CommandBase.h - What every network command class declares ----------===//
//
// Each command is one class in CorvexCli::NetworkNamespace. Its declaration in
// include/<subsystem>.h uses these macros so that the common members are
// written once:
//
//   class NicList : public virtual Fabrik::AutoCli::Command {
//     CORVEX_COMMAND(NicList)
//     CORVEX_OUTPUT_STRUCTURE
//   };
//
// CORVEX_COMMAND declares New(), the constructor and destructor and the three
// operations every command supplies; CORVEX_OUTPUT_STRUCTURE adds
// GetOutputStructure() to classes whose result holds a structure. A class adds
// its own further members after them.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/AutoCli.h"

#include <memory>

#define CORVEX_COMMAND(Class)                                                                      \
public:                                                                                            \
  static std::shared_ptr<Class> New();                                                             \
  Class();                                                                                         \
  ~Class() override;                                                                               \
                                                                                                   \
protected:                                                                                         \
  std::shared_ptr<Fabrik::CallSpec::InputSpec> GetInputSpecInternal() override;                    \
  std::shared_ptr<Fabrik::CallSpec::OutputSpec> GetOutputSpecInternal() override;                  \
  void ExecuteInternal(const std::shared_ptr<Fabrik::CallSpec::Input>& input,                      \
                       const std::shared_ptr<Fabrik::CallSpec::Output>& output) override;          \
                                                                                                   \
public:

#define CORVEX_OUTPUT_STRUCTURE                                                                    \
public:                                                                                            \
  virtual std::shared_ptr<Fabrik::MetaObj::MetaStruct> GetOutputStructure();

/// New() of the classes that derive virtually from Command: allocated with new.
#define CORVEX_DEFINE_NEW(Class)                                                                   \
  std::shared_ptr<Class> Class::New() {                                                            \
    return std::shared_ptr<Class>(new Class());                                                    \
  }

/// New() of the classes that derive directly from Command: std::make_shared.
#define CORVEX_DEFINE_MAKE_SHARED(Class)                                                           \
  std::shared_ptr<Class> Class::New() {                                                            \
    return std::make_shared<Class>();                                                              \
  }
