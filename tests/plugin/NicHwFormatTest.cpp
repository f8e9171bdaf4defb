//===- NicHwFormatTest.cpp - Text rules of the NIC hardware commands ------===//
//
// Table-driven checks of the formatting rules shared by the NIC hardware
// commands: hexadecimal dump rows and their padding, DCB mode, mask and
// array texts, load-balancer setting cells and capability texts.
//
//===----------------------------------------------------------------------===//
#include "common/DcbFormat.h"
#include "nic/HwCommon.h"

#include <gtest/gtest.h>

namespace {

using namespace CorvexCli::NetworkNamespace;

std::string Blanks(std::size_t n) {
  return std::string(n, ' ');
}

/// "00 01 02 ... " for the bytes first..first+count-1.
std::string Bytes(int first, int count) {
  std::string text;
  char digits[4];
  for (int i = 0; i < count; ++i) {
    std::snprintf(digits, sizeof digits, "%02x ", (first + i) & 0xff);
    text += digits;
  }
  return text;
}

std::vector<uint8_t> Sequence(int first, int count) {
  std::vector<uint8_t> data;
  for (int i = 0; i < count; ++i)
    data.push_back(static_cast<uint8_t>(first + i));
  return data;
}

TEST(NicHwFormat, EepromDumpRows) {
  struct Case {
    const char* what;
    std::vector<uint8_t> data;
    uint32_t offset;
    std::vector<HexDumpRow> rows;
  };
  const Case cases[] = {
      {"nothing at 0", {}, 0, {{"0000", ""}}},
      {"nothing inside a block", {}, 0x25, {{"0020", Blanks(15)}}},
      {"unaligned start",
       {0xaa, 0xbb, 0xcc, 0xdd, 0xee},
       0x13,
       {{"0010", Blanks(9) + "aa bb cc dd ee "}}},
      {"two aligned rows", Sequence(0, 32), 0, {{"0000", Bytes(0, 16)}, {"0010", Bytes(16, 16)}}},
      {"crossing a block",
       Sequence(1, 4),
       0x0e,
       {{"0000", Blanks(42) + "01 02 "}, {"0010", "03 04 "}}},
      {"short last row",
       Sequence(0x0a, 18),
       0x100,
       {{"0100", Bytes(0x0a, 16)}, {"0110", "1a 1b "}}},
      {"wide offsets", {0x0a}, 0x12345, {{"12340", Blanks(15) + "0a "}}},
  };
  for (const Case& c : cases) {
    std::vector<HexDumpRow> rows = EepromDumpRows(c.data, c.offset);
    ASSERT_EQ(rows.size(), c.rows.size()) << c.what;
    for (std::size_t i = 0; i < rows.size(); ++i) {
      EXPECT_EQ(rows[i].offset, c.rows[i].offset) << c.what << " row " << i;
      EXPECT_EQ(rows[i].value, c.rows[i].value) << c.what << " row " << i;
    }
  }
}

TEST(NicHwFormat, RegisterDumpRows) {
  EXPECT_TRUE(RegisterDumpRows({}).empty());
  std::vector<uint32_t> words(20, 0);
  words[0] = 26;
  words[1] = 5;
  words[2] = 0xdeadbeef;
  words[16] = 0x100;
  std::vector<HexDumpRow> rows = RegisterDumpRows(words);
  ASSERT_EQ(rows.size(), 2u);
  EXPECT_EQ(rows[0].offset, "0000");
  std::string first = "1a 05 deadbeef ";
  for (int i = 3; i < 16; ++i)
    first += "00 ";
  EXPECT_EQ(rows[0].value, first);
  EXPECT_EQ(rows[1].offset, "0010");
  EXPECT_EQ(rows[1].value, "100 00 00 00 ");
}

TEST(NicHwFormat, DcbTexts) {
  const std::pair<uint32_t, const char*> modes[] = {{0, "0 - Unknown"},
                                                    {1, "1 - CEN Mode"},
                                                    {2, "2 - CEE Mode"},
                                                    {3, "3 - IEEE Mode"},
                                                    {7, "7 - Unknown"}};
  for (const auto& [mode, text] : modes)
    EXPECT_EQ(DcbModeToString(mode), text);

  const std::pair<uint8_t, const char*> masks[] = {{0x00, "0 0 0 0 0 0 0 0"},
                                                   {0x09, "1 0 0 1 0 0 0 0"},
                                                   {0x80, "0 0 0 0 0 0 0 1"},
                                                   {0xff, "1 1 1 1 1 1 1 1"}};
  for (const auto& [mask, text] : masks)
    EXPECT_EQ(DcbIntMaskToString(mask), text);

  EXPECT_EQ(DcbArrayToString({12, 13, 12, 13, 12, 13, 12, 13}), "12 13 12 13 12 13 12 13");
  EXPECT_EQ(DcbArrayToString({0, 0, 0, 0, 0, 0, 0, 255}), "0 0 0 0 0 0 0 255");
}

TEST(NicHwFormat, LoadBalancerCells) {
  struct Case {
    std::size_t index;
    bool supported;
    bool allowed;
    const char* cell;
  };
  const Case cases[] = {
      {0, true, false, "SD"},  {0, true, true, "SA"},   {0, false, true, "UA"},
      {0, false, false, "UD"}, {1, true, true, "NA"},   {1, false, true, "NA"},
      {4, true, false, "ND"},  {6, false, false, "ND"}, {7, true, true, "SA"},
      {10, false, true, "UA"},
  };
  for (const Case& c : cases)
    EXPECT_EQ(NetqueueLbSettingCell(c.index, c.supported, c.allowed), c.cell)
        << "setting " << c.index;
}

std::string TestCapName(int bit) {
  return "cap" + std::to_string(bit);
}

TEST(NicHwFormat, CapabilityText) {
  const std::pair<uint64_t, const char*> cases[] = {
      {0, ""},
      {0b101, "cap0   cap2   "},
      {uint64_t{1} << 30, "cap30   "},
      {uint64_t{1} << 31, ""},
      {(uint64_t{1} << 40) | 2, "cap1   "},
  };
  for (const auto& [mask, text] : cases)
    EXPECT_EQ(HwCapText(mask, TestCapName), text) << mask;
}

} // namespace
