//===- TableTest.cpp - Parameters and result fields declared as tables -----===//
//
// A table row becomes a parameter whose check accepts and refuses what the
// row says, and whose texts are read when the parameters are built, so a
// row may name a string constant that is set after the row was made. A field
// table becomes a structure of unset fields of the declared kinds, in order.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "common/ParameterTable.h"

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace CorvexCli::NetworkNamespace;
using Fabrik::CallSpec::ParameterSpec;

const EnumChoice kModes[] = {{"fast", "Go fast"}, {"slow"}};
const long kSpeeds[] = {10, 100};

/// Filled in by the test after the table below has been made.
std::string gLateName;

const ParameterDef kTable[] = {
    {"count", "c", Fabrik::CallSpec::Integer, true, "How many", ParameterCheck::Range(1, 9)},
    {"mode", "m", Fabrik::CallSpec::String, false, "Mode: %FULLENUM%",
     ParameterCheck::OneOf(kModes)},
    {"speed", "", Fabrik::CallSpec::Integer, false, "Speed: %ENUM%",
     ParameterCheck::OneOfIntegers(kSpeeds)},
    {gLateName, "n", Fabrik::CallSpec::String, false, "Named later",
     ParameterCheck::Matching("tvk[0-9]+")},
    {"all", "a", Fabrik::CallSpec::Flag, false, "Everything"},
};

TEST(ParameterTableTest, RowsBecomeParametersWithTheirChecks) {
  gLateName = "interface-name";
  auto spec = MakeInputSpec(kTable);
  ASSERT_EQ(spec->GetParameters().size(), std::size(kTable));

  const ParameterSpec& count = *spec->GetParameters()[0];
  EXPECT_EQ(count.GetShortName(), "c");
  EXPECT_TRUE(count.IsRequired());
  EXPECT_FALSE(count.GetConstraint()->CheckInt(9));
  EXPECT_TRUE(count.GetConstraint()->CheckInt(10));

  const ParameterSpec& mode = *spec->GetParameters()[1];
  EXPECT_FALSE(mode.IsRequired());
  EXPECT_FALSE(mode.GetConstraint()->CheckString("slow"));
  EXPECT_TRUE(mode.GetConstraint()->CheckString("medium"));
  EXPECT_EQ(mode.GetExpandedDescription(), "Mode: " + mode.GetConstraint()->FullEnumText());
  EXPECT_EQ(mode.GetConstraint()->GetEnumValues()[0].description, "Go fast");
  EXPECT_EQ(mode.GetConstraint()->GetEnumValues()[1].description, "");

  const ParameterSpec& speed = *spec->GetParameters()[2];
  EXPECT_EQ(speed.GetShortName(), "");
  EXPECT_EQ(speed.GetExpandedDescription(), "Speed: 10, 100");
  EXPECT_FALSE(speed.GetConstraint()->CheckInt(100));
  EXPECT_TRUE(speed.GetConstraint()->CheckInt(1000));

  const ParameterSpec& name = *spec->GetParameters()[3];
  EXPECT_EQ(name.GetName(), "interface-name");
  EXPECT_FALSE(name.GetConstraint()->CheckString("tvk12"));
  EXPECT_TRUE(name.GetConstraint()->CheckString("tvk12x"));

  EXPECT_EQ(spec->GetParameters()[4]->GetType(), Fabrik::CallSpec::Flag);
  EXPECT_EQ(spec->GetParameters()[4]->GetConstraint(), nullptr);
}

TEST(ParameterTableTest, AddedRowsFollowTheOnesThere) {
  auto spec = MakeInputSpec({{"first", "f", Fabrik::CallSpec::String, true, "One"}});
  const std::string composed = std::string("Two, ") + "composed";
  AddParameters(*spec, {{"second", "s", Fabrik::CallSpec::StringList, false, composed}});
  ASSERT_EQ(spec->GetParameters().size(), 2u);
  EXPECT_EQ(spec->GetParameters()[1]->GetName(), "second");
  EXPECT_EQ(spec->GetParameters()[1]->GetDescription(), "Two, composed");
  EXPECT_EQ(spec->FindShortParameter("s"), spec->GetParameters()[1]);
}

TEST(FieldTableTest, FieldsAreUnsetValuesOfTheirKindInOrder) {
  const std::string name = "Name";
  auto structure = MakeStructure("Thing", {{name, FieldKind::String},
                                           {"Count", FieldKind::Integer},
                                           {"Up", FieldKind::Boolean},
                                           {"Tags", FieldKind::StringList}});
  EXPECT_EQ(structure->GetName(), "Thing");
  ASSERT_EQ(structure->GetFieldCount(), 4u);
  const Fabrik::MetaObj::MetaType kinds[] = {Fabrik::MetaObj::String, Fabrik::MetaObj::Integer,
                                             Fabrik::MetaObj::Boolean, Fabrik::MetaObj::List};
  const char* names[] = {"Name", "Count", "Up", "Tags"};
  for (std::size_t i = 0; i < structure->GetFieldCount(); ++i) {
    EXPECT_EQ(structure->GetFieldName(i), names[i]);
    EXPECT_EQ(structure->GetFieldValue(i).GetType(), kinds[i]) << names[i];
  }
  EXPECT_FALSE(structure->GetFieldValue(0).IsShown());
  EXPECT_FALSE(structure->GetFieldValue(2).IsShown());
}

} // namespace
