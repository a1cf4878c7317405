// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TextParts.h"

namespace {

constexpr const char* kKeeps = "the running driver keeps its cached values until it is restarted";

void WriteFile(const std::string& path, const std::string& text) {
  std::ofstream file(path, std::ios::binary);
  file << text;
}

class StoreCommandTest : public testing::Test {
 protected:
  StoreCommandTest() : instance_("") { instance_.Stop(); }
  InstanceRun instance_;
};

TEST_F(StoreCommandTest, StoresTypedValuesAndListsThem) {
  EXPECT_EQ(instance_.Output({"store", "set", "rx_suffix=CRLF", "baudrate=19200", "parity=even",
                              "hex_tokens=true"}),
            "4 stored: 4 new, 0 as before\n");
  EXPECT_EQ(instance_.Output({"store", "ls"}),
            "baud 19200  parity even  rx_suffix 0D0A  hex_tokens true   (override the "
            "configuration)\n");
  EXPECT_EQ(instance_.Output({"store", "get", "parity", "baudrate"}), "even\n19200\n");
  EXPECT_EQ(instance_.Output({"store", "export"}),
            "{\n  \"com1\": {\n    \"baud\": 19200,\n    \"hex_tokens\": true,\n    "
            "\"parity\": 1,\n    \"rx_suffix\": \"0D0A\"\n  }\n}\n");
  EXPECT_TRUE(Holds(instance_.Output({"store", "ls", "-j"}),
                    R"({"ident":"com1","key":"parity","value":"even"})"
                    "\n"));
}

TEST_F(StoreCommandTest, DriverStartsWithWhatWasStored) {
  EXPECT_EQ(instance_.Loka({"store", "set", "gap=77", "tx_prefix=none"}).status, 0);
  EXPECT_EQ(
      instance_.Output({"read", "0?SP_Gap?unsignedInt", "0?SP_TxPrefix?string-9", "--port",
                        instance_.Line().Path(), "--config", TestConfiguration("tx_prefix=02")}),
      "77\nnone\n");
}

TEST_F(StoreCommandTest, SaysWhatChanges) {
  EXPECT_EQ(instance_.Loka({"store", "set", "baud=9600", "gap=5"}).status, 0);
  EXPECT_EQ(instance_.Output({"store", "set", "baud=19200", "gap=5", "stop=2"}),
            "3 stored: 1 new, 1 as before, changed: baud 19200 (was 9600)\n");
}

TEST_F(StoreCommandTest, RefusesWhatTheDriverWould) {
  const InstanceRun::Result set = instance_.Loka({"store", "set", "gap=5", "bits=9"});
  EXPECT_EQ(set.status, 2);
  EXPECT_TRUE(Holds(set.errors, "bits is 7 or 8")) << set.errors;
  EXPECT_EQ(instance_.Output({"store", "ls"}), "");
}

TEST_F(StoreCommandTest, RemovesAllOrNothingOfWhatIsAsked) {
  EXPECT_EQ(instance_.Loka({"store", "set", "baud=9600", "gap=5", "stop=2"}).status, 0);
  const InstanceRun::Result missing = instance_.Loka({"store", "rm", "baud", "parity"});
  EXPECT_EQ(missing.status, 1);
  EXPECT_EQ(missing.errors, "loka: parity is not stored; nothing is removed\n");
  EXPECT_EQ(instance_.Output({"store", "get", "baud"}), "9600\n");
  EXPECT_EQ(instance_.Output({"store", "rm", "baudrate"}), "1 removed\n");
  EXPECT_EQ(instance_.Loka({"store", "get", "baud"}).status, 1);
  EXPECT_EQ(instance_.Loka({"store", "rm"}).status, 2);
  EXPECT_EQ(instance_.Loka({"store", "rm", "--all", "gap"}).status, 2);
  EXPECT_EQ(instance_.Output({"store", "rm", "--all"}), "2 removed\n");
  EXPECT_EQ(instance_.Output({"store", "rm", "--all"}), "0 removed\n");
}

TEST_F(StoreCommandTest, ImportsWhatItExported) {
  EXPECT_EQ(instance_.Loka({"store", "set", "baud=9600", "hex_tokens=on"}).status, 0);
  EXPECT_EQ(instance_.Loka({"store", "set", "--ident", "scale", "rx_suffix=CR"}).status, 0);
  const std::string exported = instance_.Output({"store", "export"});
  const std::string file = instance_.File("settings.json");
  WriteFile(file, exported);
  const std::string other = instance_.File("other.db");
  EXPECT_EQ(instance_.Output({"store", "import", file, "--store", other}),
            "3 stored: 3 new, 0 as before\n");
  EXPECT_EQ(instance_.Output({"store", "export", "--store", other}), exported);
  EXPECT_EQ(instance_.Output({"store", "ls"}),
            "com1: baud 9600  hex_tokens true   (override the configuration)\n"
            "scale: rx_suffix 0D   (override the configuration)\n");
  // Whose settings are meant must be said now.
  const InstanceRun::Result remove = instance_.Loka({"store", "rm", "--all"});
  EXPECT_EQ(remove.status, 2);
  EXPECT_TRUE(Holds(remove.errors, "holds settings of com1, scale; say whose with --ident"))
      << remove.errors;
  EXPECT_EQ(instance_.Output({"store", "rm", "--all", "--ident", "scale"}), "1 removed\n");
}

TEST_F(StoreCommandTest, ImportsNothingOfAFileThatIsNotRight) {
  const std::string file = instance_.File("settings.json");
  for (const char* const text :
       {"", "[]", "{\"com1\":1}", "{\"com1\":{\"gap\":5,\"baud\":\"9600\"}}",
        "{\"com1\":{\"gap\":5,\"hex_tokens\":1}}", "{\"com1\":{\"gap\":2147483648}}",
        "{\"com1\":{\"gap\":1.5}}", "{\"com1\":{\"gap\":null}}",
        "{\"com1\":{\"rx_suffix\":\"0D\\u00000A\"}}"}) {
    WriteFile(file, text);
    const InstanceRun::Result import = instance_.Loka({"store", "import", file});
    EXPECT_EQ(import.status, 2) << text;
    EXPECT_TRUE(Holds(import.errors, "nothing is stored")) << import.errors;
  }
  EXPECT_EQ(instance_.Output({"store", "ls"}), "");
  EXPECT_EQ(instance_.Loka({"store", "import", instance_.File("absent")}).status, 2);
}

TEST_F(StoreCommandTest, LooksWithoutMakingAFile) {
  const std::string file = instance_.File("absent/store.db");
  const InstanceRun::Result list = instance_.Loka({"store", "ls", "--store", file});
  EXPECT_EQ(list.status, 0);
  EXPECT_EQ(list.errors, "loka: nothing is stored in " + file + "\n");
  EXPECT_EQ(instance_.Output({"store", "export", "--store", file}), "{}\n");
  EXPECT_EQ(instance_.Output({"store", "rm", "--all", "--store", file}), "0 removed\n");
  EXPECT_FALSE(std::filesystem::exists(instance_.File("absent")));
  const std::string foreign = instance_.File("text");
  WriteFile(foreign, "not a store, and long enough to be looked at as if it were a database file");
  EXPECT_EQ(instance_.Loka({"store", "ls", "--store", foreign}).status, 1);
}

TEST(StoreOfRunningInstance, SaysThatTheDriverKeepsItsValues) {
  InstanceRun instance("gap=5");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Loka({"set", "baud=19200", "rx_suffix=0D0A"}).status, 0);
  const InstanceRun::Result remove = instance.Loka({"store", "rm", "--all"});
  EXPECT_EQ(remove.output, std::string("2 removed; ") + kKeeps + "\n");
  EXPECT_EQ(remove.errors,
            "loka: a later loka set there stores again what was set since its start\n");
  EXPECT_EQ(instance.Output({"read", "0?SP_Baud?unsignedInt"}), "19200\n");
  // As that line says.
  EXPECT_EQ(instance.Loka({"set", "gap=6"}).status, 0);
  EXPECT_EQ(instance.Output({"store", "ls"}),
            "baud 19200  rx_suffix 0D0A  gap 6   (override the configuration)\n");
  EXPECT_TRUE(Holds(instance.Output({"store", "set", "gap=7"}), kKeeps));
  // Another file is not the driver's.
  EXPECT_FALSE(Holds(
      instance.Output({"store", "set", "gap=7", "--store", instance.File("other.db")}), kKeeps));
}

TEST_F(StoreCommandTest, HelpShowsExamples) {
  for (const char* const action : {"ls", "get", "set", "rm", "export", "import"}) {
    EXPECT_TRUE(Holds(instance_.Output({"store", action, "--help"}),
                      std::string("Example: loka store ") + action))
        << action;
  }
  EXPECT_EQ(instance_.Loka({"store"}).status, 2);
}

}  // namespace
