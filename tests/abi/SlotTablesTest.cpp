// SPDX-License-Identifier: Apache-2.0
// The tables that the compiler laid out, read from the object files of this build, against the
// tables as they were agreed: slot_tables.txt. The same text holds for every processor.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <string>

#include "tests/abi/VirtualTables.h"

namespace {

std::string FileText(const std::string& name) {
  std::ifstream file(name);
  return std::string((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
}

// LOKA_OBJECT_LIST names a file with an object file a line.
SlotTables BuiltTables() {
  SlotTables tables;
  std::ifstream list(LOKA_OBJECT_LIST);
  for (std::string line; std::getline(list, line);) {
    if (!line.empty()) AddSlotTables(line, tables);
  }
  // Bases of the stand-ins, whose tables only a build without optimisation keeps.
  for (auto table = tables.begin(); table != tables.end();) {
    table =
        table->first.rfind("host_shape::Named<", 0) == 0 ? tables.erase(table) : std::next(table);
  }
  return tables;
}

std::string Golden() {
  return FileText(std::string(LOKA_SOURCE_DIR) + "/tests/abi/slot_tables.txt");
}

TEST(SlotTablesTest, AreTheAgreedOnes) {
  // When slots were only appended on purpose, the printed tables replace the agreed text.
  EXPECT_EQ(FormatSlotTables(BuiltTables()), Golden());
}

TEST(SlotTablesTest, AllClassesAreRead) {
  const SlotTables tables = BuiltTables();
  for (const char* name :
       {"InterfaceFactory", "ProtModule", "ProtocolFactory", "Protocol_LOKA", "TaskRunner_LOKA",
        "Tag_LOKA", "host_shape::MultiTask", "host_shape::PermanentStorage"}) {
    EXPECT_EQ(tables.count(name), 1U) << name;
  }
  ASSERT_EQ(tables.count("Protocol_LOKA"), 1U);
  EXPECT_EQ(tables.at("Protocol_LOKA").size(), 85U);
  EXPECT_EQ(tables.count("ProtocolBase"), 0U) << "an abstract class has no table of its own";
}

// The comparison notices two operations in each other's place.
TEST(SlotTablesTest, ASwapIsNoticed) {
  SlotTables tables = BuiltTables();
  ASSERT_EQ(tables.count("ProtModule"), 1U);
  std::swap(tables["ProtModule"][5], tables["ProtModule"][6]);
  EXPECT_NE(FormatSlotTables(tables), Golden());
}

TEST(SlotTablesTest, WhatIsNoObjectFileIsRefused) {
  SlotTables tables;
  EXPECT_THROW(AddSlotTables(std::string(LOKA_SOURCE_DIR) + "/README.md", tables),
               std::runtime_error);
  EXPECT_THROW(AddSlotTables("/nonexistent", tables), std::runtime_error);
}

}  // namespace
