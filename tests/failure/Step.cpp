// SPDX-License-Identifier: Apache-2.0
#include "tests/failure/Step.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <utility>

#include "tests/support/HostCall.h"

namespace {

using Tokens = Step::Tokens;
using Prepare = std::function<void(Bench&)>;
using Run = std::function<bool(Bench&)>;

// Member of a list of steps that are the same but for a word.
struct Named {
  const char* name;
  const char* text;
  const char* value;
};

int SizeOf(const std::array<char, 4000>& reply) { return static_cast<int>(reply.size()) - 1; }

// --- life ---

void AddLife(std::vector<Step>& steps) {
  steps.push_back({"Init", Tokens::kNone, [](Bench& bench) { bench.plugin.Close(); },
                   [](Bench& bench) { return bench.plugin.Init(&bench.host) != 0; }});
  steps.push_back({"Create", Tokens::kNone, [](Bench&) {},
                   [](Bench& bench) {
                     IProtocol* const created = bench.plugin.Protocols()->CreateProtocol("LOKA");
                     if (created == nullptr) return false;
                     bench.protocol = static_cast<IProtocol7*>(created->ConvertTo("IProtocol7"));
                     return true;
                   }});
  steps.push_back(
      {"Config", Tokens::kNone, [](Bench& bench) { bench.Create(); },
       [](Bench& bench) { return bench.protocol->Config(Texts::kConfig.c_str()) != 0; }});
  steps.push_back({"ConfigThatIsRefused", Tokens::kStay, [](Bench& bench) { bench.Run(); },
                   [](Bench& bench) {
                     return bench.protocol->Config(
                                "CfgVer=1 model=a-model-of-a-rather-long-name") == 0 &&
                            bench.protocol->GetLastError() == -1;
                   }});
  steps.push_back({"SetIdent", Tokens::kStay, [](Bench& bench) { bench.Run(); },
                   [](Bench& bench) {
                     bench.protocol->SetIdent(Texts::kIdent.c_str());
                     return Texts::kIdent == bench.protocol->GetIdent();
                   }});
  const Run start = [](Bench& bench) { return bench.protocol->Start() != 0; };
  steps.push_back({"Start", Tokens::kNone,
                   [](Bench& bench) {
                     bench.Create();
                     EXPECT_NE(bench.protocol->Config(Texts::kConfig.c_str()), 0);
                   },
                   start});
  for (const bool isExtended : {false, true}) {
    steps.push_back(
        {isExtended ? "StartOverExtendedStorage" : "StartOverStorage", Tokens::kNone,
         [isExtended](Bench& bench) {
           bench.host.Storage().SetExtended(isExtended);
           bench.Create();
           bench.protocol->SetIdent(Texts::kIdent.c_str());
           EXPECT_NE(bench.protocol->Config(Texts::kConfig.c_str()), 0);
           for (const char* key : {"rx_prefix", "rx_suffix", "tx_prefix", "tx_suffix"}) {
             bench.host.Storage().PutString(Texts::kIdent, key, Texts::kHexText);
           }
           bench.host.Storage().Put(Texts::kIdent, "baud", 300);
           bench.host.Storage().PutBoolean(Texts::kIdent, "hex_tokens", true);
         },
         start});
  }
  steps.push_back({"StartAgain", Tokens::kStay,
                   [](Bench& bench) {
                     bench.Run();
                     bench.protocol->Stop();
                   },
                   start});
  steps.push_back({"Stop", Tokens::kStay, [](Bench& bench) { bench.Run(); },
                   [](Bench& bench) { return bench.protocol->Stop() != 0; }});
  steps.push_back({"DeleteStopped", Tokens::kNone,
                   [](Bench& bench) {
                     bench.Run();
                     bench.MakeTag("0?rx_token?string-300");
                     bench.protocol->Stop();
                   },
                   [](Bench& bench) {
                     bench.plugin.Protocols()->DeleteProtocol(
                         std::exchange(bench.protocol, nullptr));
                     return true;
                   }});
  steps.push_back({"DeleteStarted", Tokens::kNone,
                   [](Bench& bench) {
                     bench.Run();
                     bench.MakeTag("0?rx_token?string-300");
                   },
                   [](Bench& bench) {
                     bench.plugin.Protocols()->DeleteProtocol(
                         std::exchange(bench.protocol, nullptr));
                     return true;
                   }});
}

// --- tags ---

void AddTags(std::vector<Step>& steps) {
  for (const Named& tag : {Named{"CreateTag", "0?rx_token?string-300", ""},
                           Named{"CreateTagWithConversions",
                                 " 1 ? SP_Gap ? unsignedInt ( swapnibble , swap2 , swap4 )", ""}}) {
    steps.push_back(
        {tag.name, Tokens::kStay, [](Bench& bench) { bench.Run(); },
         [tag](Bench& bench) { return bench.protocol->CreateTag(tag.text) != nullptr; }});
  }
  for (const Named& tag :
       {Named{"RefusedTagOfFourFields", "0?rx_token?string-300?and-another-field-behind", ""},
        Named{"RefusedTagOfUnknownMemory", "0?a-memory-type-of-a-long-name?boolean", ""},
        Named{"RefusedTagOfUnknownType", "0?rx_token?a-data-type-of-a-long-name", ""},
        Named{"RefusedTagOfUnknownModel", "2?rx_token?string-300", ""}}) {
    steps.push_back({tag.name, Tokens::kStay, [](Bench& bench) { bench.Run(); },
                     [tag](Bench& bench) {
                       return bench.protocol->CreateTag(tag.text) == nullptr &&
                              bench.protocol->GetLastError() == -1;
                     }});
  }
  steps.push_back({"Clone", Tokens::kStay,
                   [](Bench& bench) {
                     bench.Run();
                     bench.MakeTag("0?SP_Gap?unsignedInt(swapnibble,swap2,swap4)");
                   },
                   [](Bench& bench) {
                     ITag* const copy = bench.tag->Clone();
                     if (copy == nullptr) return false;
                     bench.protocol->FreeTag(copy);
                     return true;
                   }});
  const auto prepareConversion = [](Bench& bench) {
    bench.Run();
    bench.MakeTag("0?tx_token?string-300(swapnibble,swap2)");
  };
  for (const bool toDevice : {false, true}) {
    steps.push_back({toDevice ? "ConvertToDevice" : "ConvertToHost", Tokens::kStay,
                     prepareConversion, [toDevice](Bench& bench) {
                       return bench.tag->Convert(bench.value.data(), bench.value.data() + 300,
                                                 toDevice);
                     }});
  }
  steps.push_back({"ConversionThatFails", Tokens::kStay,
                   [](Bench& bench) {
                     bench.Run();
                     bench.MakeTag("0?tx_token?string-300(a-conversion-that-nobody-knows)");
                   },
                   [](Bench& bench) {
                     return !bench.tag->Convert(bench.value.data(), bench.value.data() + 300, true);
                   }});
}

// --- reads and writes ---

Prepare WithTag(const char* uri) {
  return [uri](Bench& bench) {
    bench.Run();
    bench.MakeTag(uri);
  };
}

bool Reads(Bench& bench) { return bench.protocol->Read(bench.tag, bench.value.data()) != 0; }
bool Writes(Bench& bench) { return bench.protocol->Write(bench.tag, bench.value.data()) != 0; }

void AddReads(std::vector<Step>& steps) {
  for (const Named& read :
       {Named{"rx_token", "0?rx_token?string-500", ""},
        Named{"tx_token", "0?tx_token?string-300", ""},
        Named{"rx_token_len", "0?rx_token_len?unsignedInt", ""},
        Named{"tokens_available", "0?tokens_available?unsignedInt(swap4)", ""},
        Named{"token_ack", "0?token_ack?boolean", ""}, Named{"connect", "0?connect?boolean", ""},
        Named{"SP_Baud", "0?SP_Baud?unsignedInt", ""},
        Named{"SP_Bits", "0?SP_Bits?unsignedByte", ""},
        Named{"SP_Stop", "0?SP_Stop?unsignedByte", ""},
        Named{"SP_Par", "0?SP_Par?unsignedByte", ""},
        Named{"SP_Mode", "0?SP_Mode?unsignedByte", ""},
        Named{"SP_RxPrefix", "0?SP_RxPrefix?string-300", ""},
        Named{"SP_RxSuffix", "0?SP_RxSuffix?string-300", ""},
        Named{"SP_TxPrefix", "0?SP_TxPrefix?string-300", ""},
        Named{"SP_TxSuffix", "0?SP_TxSuffix?string-300", ""},
        Named{"SP_Gap", "0?SP_Gap?unsignedInt", ""},
        Named{"SP_HexTokens", "0?SP_HexTokens?boolean", ""},
        Named{"SP_TokenQueueSize", "0?SP_TokenQueueSize?unsignedInt", ""},
        Named{"SP_Done", "0?SP_Done?boolean", ""}}) {
    steps.push_back({std::string("Read_") + read.name, Tokens::kStay, WithTag(read.text), Reads});
  }
  steps.push_back({"ReadBlock", Tokens::kStay, WithTag("0?rx_token?string-500"), [](Bench& bench) {
                     return bench.protocol->ReadBlock(bench.tag, bench.value.data(), 400) != 0;
                   }});
  steps.push_back(
      {"readWithTimestamp", Tokens::kStay, WithTag("0?rx_token?string-500"), [](Bench& bench) {
         unsigned long long stamp = 0;
         return bench.protocol->readWithTimestamp(bench.tag, bench.value.data(), &stamp) != 0 &&
                stamp != 0;
       }});
  steps.push_back(
      {"readArrayItem", Tokens::kStay, WithTag("0?rx_token?string-500"), [](Bench& bench) {
         return bench.protocol->readArrayItem(bench.tag, 1, bench.value.data()) != 0;
       }});
  steps.push_back({"writeArrayItem", Tokens::kStay, WithTag("0?SP_TxPrefix?string-500"),
                   [](Bench& bench) {
                     return bench.protocol->writeArrayItem(bench.tag, 1, bench.value.data()) != 0;
                   },
                   [](Bench& bench) { bench.SetValue("A"); }});
  steps.back().prepare = [](Bench& bench) {
    WithTag("0?SP_TxPrefix?string-500")(bench);
    bench.SetValue("A");
  };
}

void AddWrites(std::vector<Step>& steps) {
  const std::string on(1, '\1');
  const struct {
    const char* name;
    const char* uri;
    std::string value;
    Tokens tokens;
  } writes[] = {{"tx_token", "0?tx_token?string-300", std::string(200, 'T'), Tokens::kStay},
                {"token_ack", "0?token_ack?boolean", on, Tokens::kMayGo},
                {"connect_off", "0?connect?boolean", std::string(1, '\0'), Tokens::kStay},
                {"connect_on_again", "0?connect?boolean", on, Tokens::kStay},
                {"SP_Baud", "0?SP_Baud?unsignedInt", {'\x2C', '\1', '\0', '\0'}, Tokens::kStay},
                {"SP_Bits", "0?SP_Bits?unsignedByte", "\7", Tokens::kStay},
                {"SP_Stop", "0?SP_Stop?unsignedByte", "\2", Tokens::kStay},
                {"SP_Par", "0?SP_Par?unsignedByte", "\2", Tokens::kStay},
                {"SP_Mode", "0?SP_Mode?unsignedByte", "\1", Tokens::kStay},
                {"SP_RxPrefix", "0?SP_RxPrefix?string-300", std::string(100, '0'), Tokens::kStay},
                {"SP_RxSuffix", "0?SP_RxSuffix?string-300", std::string(100, '0'), Tokens::kStay},
                {"SP_TxPrefix", "0?SP_TxPrefix?string-300", std::string(100, '0'), Tokens::kStay},
                {"SP_TxSuffix", "0?SP_TxSuffix?string-300", std::string(100, '0'), Tokens::kStay},
                {"SP_Gap", "0?SP_Gap?unsignedInt(swap4,swapnibble)", "\7", Tokens::kStay},
                {"SP_HexTokens", "0?SP_HexTokens?boolean", on, Tokens::kStay},
                {"SP_TokenQueueSize", "0?SP_TokenQueueSize?unsignedInt", "\7", Tokens::kStay}};
  for (const auto& write : writes) {
    steps.push_back({std::string("Write_") + write.name, write.tokens,
                     [write](Bench& bench) {
                       WithTag(write.uri)(bench);
                       bench.SetValue(write.value);
                     },
                     Writes});
  }
  steps.push_back({"Write_tx_token_in_hex_mode", Tokens::kStay,
                   [](Bench& bench) {
                     WithTag("0?tx_token?string-300")(bench);
                     bench.protocol->DoCommand("set_hexToken ON", bench.reply.data(),
                                               SizeOf(bench.reply));
                     bench.SetValue(std::string(200, '4'));
                   },
                   Writes});
  steps.push_back(
      {"Write_tx_token_refused", Tokens::kStay,
       [](Bench& bench) {
         WithTag("0?tx_token?string-300")(bench);
         bench.protocol->DoCommand("set_hexToken ON", bench.reply.data(), SizeOf(bench.reply));
         bench.SetValue(std::string(201, '4'));
       },
       [](Bench& bench) { return !Writes(bench) && bench.protocol->GetLastError() == -1; }});
  steps.push_back({"Write_connect_on", Tokens::kStay,
                   [](Bench& bench) {
                     WithTag("0?connect?boolean")(bench);
                     EXPECT_TRUE(Writes(bench));
                     bench.SetValue("\1");
                   },
                   Writes});
  steps.push_back({"SP_Done", Tokens::kMayGo,
                   [](Bench& bench) {
                     bench.Run();
                     for (const char* type : {"RxPrefix", "RxSuffix", "TxPrefix", "TxSuffix"}) {
                       bench.Write(("0?SP_" + std::string(type) + "?string-300").c_str(),
                                   std::string(100, '0'));
                     }
                     bench.Write("0?SP_Par?unsignedByte", "\2");
                     bench.Write("0?SP_HexTokens?boolean", "\1");
                     bench.Write("0?SP_Gap?unsignedInt", "\7");
                     bench.Write("0?SP_TokenQueueSize?unsignedInt", "\7");
                     bench.MakeTag("0?SP_Done?boolean");
                     bench.SetValue("\1");
                   },
                   [](Bench& bench) {
                     if (!Writes(bench)) return false;
                     const HostCall inside;  // what follows is not the driver's
                     return bench.host.Storage().Dump().find("LOKA parity = 2\n") !=
                            std::string::npos;
                   }});
}

// --- receiving ---

void AddReceive(std::vector<Step>& steps) {
  const struct {
    const char* name;
    const char* framing;  // console commands that set the framing, separated by ";"
    std::string line;
    int tokens;
  } lines[] = {
      {"PrefixAndSuffix", "", "\x02" + std::string(200, 'T') + "\x03", 1},
      {"ThreeTokens", "",
       "\x02"
       "A\x03\x02" +
           std::string(50, 'B') +
           "\x03\x02"
           "C\x03",
       3},
      {"HexMode", "set_hexToken ON", "\x02" + std::string(200, 'T') + "\x03", 1},
      {"PrefixOnly", "set_rxSuffix none",
       "\x02" + std::string(60, 'T') + "\x02" + std::string(60, 'U'), 2},
      {"SuffixOnly", "set_rxPrefix none",
       std::string(60, 'T') + "\x03" + std::string(60, 'U') + "\x03", 2},
      {"SilenceOnly", "set_rxPrefix none;set_rxSuffix none", std::string(60, 'T'), 1},
      {"TooLong", "", "\x02" + std::string(1500, 'T') + "\x02" + std::string(60, 'U') + "\x03", 1}};
  for (const auto& line : lines) {
    const auto feed = [line](Bench& bench) { bench.Feed(line.line); };
    steps.push_back({std::string("Receive_") + line.name, Tokens::kStay,
                     [line, feed](Bench& bench) {
                       bench.Run();
                       const std::string commands = line.framing;
                       for (std::size_t at = 0; at < commands.size();) {
                         const std::size_t end = std::min(commands.find(';', at), commands.size());
                         bench.protocol->DoCommand(commands.substr(at, end - at).c_str(),
                                                   bench.reply.data(), SizeOf(bench.reply));
                         at = end + 1;
                       }
                       feed(bench);
                     },
                     [line](Bench& bench) {
                       const int before = bench.TokenCount();
                       bench.host.RunUntilSilent();
                       return bench.TokenCount() == before + line.tokens;
                     },
                     [feed](Bench& bench) {
                       bench.host.RunUntilSilent();  // the rest of a line that was not taken
                       feed(bench);
                     },
                     line.line.size() < 300});
  }
  const auto feed = [](Bench& bench) { bench.Feed("\x02" + std::string(60, 'T') + "\x03"); };
  steps.push_back({"Receive_QueueIsFull", Tokens::kMove,
                   [feed](Bench& bench) {
                     bench.Run("token_queue_size=2");
                     feed(bench);
                   },
                   [](Bench& bench) {
                     bench.host.RunUntilSilent();
                     return bench.TokenCount() == 2 && bench.Front() == "kept two";
                   },
                   [](Bench& bench) {
                     bench.protocol->DoCommand("token_ack all", bench.reply.data(),
                                               SizeOf(bench.reply));
                     bench.Feed("\x02kept one\x03\x02kept two\x03\x02new\x03");
                   }});
}

// --- console and information ---

std::string Repeated(int times, const std::string& text) {
  std::string repeated;
  for (int i = 0; i < times; ++i) repeated += text;
  return repeated;
}

void AddConsole(std::vector<Step>& steps) {
  const struct {
    const char* name;
    std::string command;
    std::string reply;  // how it begins
    Tokens tokens;
  } commands[] = {
      {"help", "help", "help - displays", Tokens::kStay},
      {"info", "info", "Protocol: LOKA", Tokens::kStay},
      {"xml", "xml", "compressedXML=", Tokens::kStay},
      {"lasterror", "lasterror", "", Tokens::kStay},
      {"getmaxtm", "getmaxtm", "maxtm = 0 ms", Tokens::kStay},
      {"deletetags", "deletetags", "", Tokens::kStay},
      {"read", "read 0?rx_token?string-300", "6b657074206f6e6500", Tokens::kStay},
      {"read_number", "read 0?SP_Baud?unsignedInt(swapnibble)", "08520000", Tokens::kStay},
      {"write", "write 0?SP_TxPrefix?string-20 3030303030303030303030303030303030303030",
       "written ok", Tokens::kStay},
      {"write_long", "write 0?SP_TxPrefix?string-100 " + Repeated(40, "30") + Repeated(60, "00"),
       "written ok", Tokens::kStay},
      {"connect_OFF", "connect OFF", "OK", Tokens::kStay},
      {"connect_ON", "connect ON", "OK", Tokens::kStay},
      {"get_stat", "get_stat", "Connected", Tokens::kStay},
      {"put", "put a token that is longer than a short string", "OK", Tokens::kStay},
      {"get", "get", "kept one", Tokens::kStay},
      {"get_token_length", "get_token_length", "8", Tokens::kStay},
      {"tokens_available", "tokens_available", "2", Tokens::kStay},
      {"token_ack", "token_ack", "OK", Tokens::kMayGo},
      {"token_ack_all", "token_ack all", "OK", Tokens::kMayGo},
      {"set_hexToken", "set_hexToken ON", "OK", Tokens::kStay},
      {"set_rxGap", "set_rxGap 30", "OK", Tokens::kStay},
      {"set_rxPrefix", "set_rxPrefix 020202020202020202020202020202020202", "OK", Tokens::kStay},
      {"set_rxSuffix", "set_rxSuffix 020202020202020202020202020202020202", "OK", Tokens::kStay},
      {"set_txPrefix", "set_txPrefix 020202020202020202020202020202020202", "OK", Tokens::kStay},
      {"set_txSuffix", "set_txSuffix 020202020202020202020202020202020202", "OK", Tokens::kStay}};
  for (const auto& command : commands) {
    steps.push_back({std::string("Console_") + command.name, command.tokens,
                     [](Bench& bench) { bench.Run(); },
                     [command](Bench& bench) {
                       bench.reply.fill('\0');
                       const bool result = bench.protocol->DoCommand(
                           command.command.c_str(), bench.reply.data(), SizeOf(bench.reply));
                       return result && std::strncmp(bench.reply.data(), command.reply.c_str(),
                                                     command.reply.size()) == 0;
                     }});
  }
  steps.push_back(
      {"Console_connect_ON_after_OFF", Tokens::kStay,
       [](Bench& bench) {
         bench.Run();
         bench.protocol->DoCommand("connect OFF", bench.reply.data(), SizeOf(bench.reply));
       },
       [](Bench& bench) {
         bench.protocol->DoCommand("connect ON", bench.reply.data(), SizeOf(bench.reply));
         return bench.IsReply("OK");
       }});
}

void AddInformation(std::vector<Step>& steps) {
  steps.push_back({"GetInfo", Tokens::kStay, [](Bench& bench) { bench.Run(); },
                   [](Bench& bench) {
                     return bench.protocol->GetInfo(bench.reply.data(), SizeOf(bench.reply)) > 20;
                   }});
  steps.push_back({"vcsGetComParams", Tokens::kStay, [](Bench& bench) { bench.Run(); },
                   [](Bench& bench) {
                     return bench.protocol->vcsGetComParams(bench.reply.data(),
                                                            SizeOf(bench.reply)) != 0;
                   }});
  steps.push_back({"GetLastErrorString", Tokens::kStay,
                   [](Bench& bench) {
                     bench.Run();
                     bench.protocol->CreateTag("0?a-memory-type-of-a-long-name?boolean");
                   },
                   [](Bench& bench) {
                     return std::strncmp(bench.protocol->GetLastErrorString(), "Tag URI", 7) == 0;
                   }});
  // What never allocates and never calls the host.
  steps.push_back({"Questions", Tokens::kStay, WithTag("0?rx_token?string-300"), [](Bench& bench) {
                     int length = 0;
                     const IProtocol7& protocol = *bench.protocol;
                     return protocol.getTagUriField(bench.tag, 1, &length) != nullptr &&
                            protocol.GetXml() != nullptr && protocol.GetNodeID(bench.tag) == 0 &&
                            protocol.CanBeOptimized(bench.tag, bench.tag, false) &&
                            bench.protocol->createAlarm("x") == nullptr &&
                            bench.protocol->ConvertTo("IProtocol7") == bench.protocol;
                   }});
}

std::vector<Step> MakeSteps() {
  std::vector<Step> steps;
  AddLife(steps);
  AddTags(steps);
  AddReads(steps);
  AddWrites(steps);
  AddReceive(steps);
  AddConsole(steps);
  AddInformation(steps);
  return steps;
}

}  // namespace

const std::vector<Step>& AllSteps() {
  static const std::vector<Step> kSteps = MakeSteps();
  return kSteps;
}
