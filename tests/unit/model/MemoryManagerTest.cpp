// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "model/MemoryManager.h"

namespace {

MemoryType TypeNamed(const std::string& name, int maxIndex) {
  MemoryType type;
  type.setName(name);
  type.setMaxIndex(maxIndex);
  return type;
}

Model ModelNamed(const std::string& name, int maxIndex) {
  Model model(name);
  model.setMaxDatagramItems(3);
  model.setMaxDatagramLength(100);
  model.addMemoryType(TypeNamed("tx_token", maxIndex));
  return model;
}

}  // namespace

TEST(ModelTest, FirstOfTwoEqualNamesStays) {
  Model model("1");
  model.addMemoryType(TypeNamed("tx_token", 1));
  model.addMemoryType(TypeNamed("tx_token", 2));
  ASSERT_NE(model.findMemoryType("tx_token"), nullptr);
  EXPECT_EQ(model.findMemoryType("tx_token")->getMaxIndex(), 1);
}

TEST(ModelTest, NamesAreComparedByteForByte) {
  Model model("1");
  model.addMemoryType(TypeNamed("tx_token", 1));
  for (const std::string name : {"tx_token ", " tx_token", "TX_TOKEN", "tx_toke", ""}) {
    EXPECT_EQ(model.findMemoryType(name), nullptr) << name;
  }
  EXPECT_EQ(model.findMemoryType(std::string("tx_token\0", 9)), nullptr);
  model.addMemoryType(TypeNamed("TX_TOKEN", 2));
  EXPECT_EQ(model.findMemoryType("TX_TOKEN")->getMaxIndex(), 2);
}

TEST(ModelTest, HoldsACopy) {
  Model model("1");
  MemoryType type = TypeNamed("a", 1);
  model.addMemoryType(type);
  type.setMaxIndex(2);
  EXPECT_EQ(model.findMemoryType("a")->getMaxIndex(), 1);
}

TEST(MemoryManagerTest, EmptyManagerHasNoModel) {
  const MemoryManager manager;
  EXPECT_EQ(manager.getModel("1"), nullptr);
  EXPECT_EQ(manager.getMemoryType("1", "tx_token"), nullptr);
}

TEST(MemoryManagerTest, FindsModelsByExactName) {
  MemoryManager manager;
  manager.addModel(ModelNamed("1", 1));
  manager.addModel(ModelNamed("2", 2));
  EXPECT_EQ(manager.getModel("1")->getName(), "1");
  EXPECT_EQ(manager.getModel("2")->getName(), "2");
}

TEST(MemoryManagerTest, UnknownModelIsTheFirstOne) {
  MemoryManager manager;
  manager.addModel(ModelNamed("1", 1));
  manager.addModel(ModelNamed("2", 2));
  EXPECT_EQ(manager.getModel("3"), manager.getModel("1"));
  EXPECT_EQ(manager.getModel(""), manager.getModel("1"));
}

TEST(MemoryManagerTest, MemoryTypeOfAnUnknownModelIsNotFound) {
  MemoryManager manager;
  manager.addModel(ModelNamed("1", 1));
  EXPECT_EQ(manager.getMemoryType("3", "tx_token"), nullptr);
  EXPECT_EQ(manager.getMemoryType("1", "rx_token"), nullptr);
  ASSERT_NE(manager.getMemoryType("1", "tx_token"), nullptr);
  EXPECT_EQ(manager.getMemoryType("1", "tx_token")->getMaxIndex(), 1);
}

TEST(MemoryManagerTest, FirstOfTwoEqualModelsIsFound) {
  MemoryManager manager;
  manager.addModel(ModelNamed("1", 1));
  manager.addModel(ModelNamed("1", 2));
  EXPECT_EQ(manager.getMemoryType("1", "tx_token")->getMaxIndex(), 1);
}

TEST(MemoryManagerTest, HoldsACopy) {
  MemoryManager manager;
  Model model = ModelNamed("1", 1);
  manager.addModel(model);
  model.addMemoryType(TypeNamed("later", 1));
  EXPECT_EQ(manager.getMemoryType("1", "later"), nullptr);
}
