// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <set>

#include "host/sim/CommandCollector.h"
#include "host/sim/DeviceCatalogue.h"
#include "host/sim/PrinterDevice.h"
#include "host/text/ByteText.h"

namespace {

std::unique_ptr<Device> Make(const std::string& name, DeviceSettings settings = {}) {
  for (const DeviceKind& kind : DeviceKinds()) {
    if (kind.name == name) {
      settings.framing = kind.framing;
      return kind.make(settings);
    }
  }
  return nullptr;
}

std::string Body(Device* device) {
  const auto message = device->NextMessage();
  return message ? message->body : "(none)";
}

std::vector<std::string> Bodies(const DeviceAnswer& answer) {
  std::vector<std::string> bodies;
  for (const DeviceMessage& reply : answer.replies) {
    bodies.push_back(reply.framing.prefix + reply.body + reply.framing.suffix);
  }
  return bodies;
}

using Texts = std::vector<std::string>;

TEST(CommandCollector, EndsACommandAtCrLfOrEtx) {
  CommandCollector collector;
  Texts commands;
  for (const char byte : std::string("R\r\nZ\n\x02T\x03xx\x02SI\x03")) {
    if (const auto command = collector.OnByte(byte)) {
      commands.push_back(*command);
    }
  }
  EXPECT_EQ(commands, (Texts{"R", "Z", "T", "SI"}));
  EXPECT_FALSE(collector.Take());
  EXPECT_FALSE(collector.OnByte('R'));
  EXPECT_EQ(collector.Take(), "R");
  EXPECT_FALSE(collector.Take());
}

TEST(CommandCollector, DropsWhatIsTooLong) {
  CommandCollector collector;
  for (std::size_t i = 0; i < CommandCollector::kMaxCommandBytes + 10; ++i) {
    EXPECT_FALSE(collector.OnByte('x'));
  }
  EXPECT_EQ(collector.OnByte('\r')->size(), CommandCollector::kMaxCommandBytes);
}

TEST(ScaleDevice, SendsItsWeightBetweenStxAndEtx) {
  const auto scale = Make("scale");
  const auto message = scale->NextMessage();
  ASSERT_TRUE(message);
  EXPECT_EQ(message->body, "ST,GS+  5.12kg");
  EXPECT_EQ(message->framing.prefix, "\x02");
  EXPECT_EQ(message->framing.suffix, "\x03");
  EXPECT_EQ(Body(scale.get()), "ST,GS+  5.12kg");
}

TEST(ScaleDevice, AnswersCommands) {
  const auto scale = Make("scale");
  const DeviceAnswer weight = scale->OnBytes("R\r\n");
  EXPECT_EQ(Bodies(weight), Texts{"\x02ST,GS+  5.12kg\x03"});
  ASSERT_EQ(weight.received.size(), 1U);
  EXPECT_EQ(weight.received[0].what, "weight request");
  EXPECT_EQ(weight.received[0].bytes, "R");
  EXPECT_EQ(Bodies(scale->OnBytes("s")), Texts());
  EXPECT_EQ(Bodies(scale->OnBytes("i")), Texts());
  EXPECT_EQ(Bodies(scale->OnSilence()), Texts{"\x02ST,GS+  5.12kg\x03"});
  EXPECT_EQ(Bodies(scale->OnBytes("T\r")), Texts{"\x02OK\x03"});
  EXPECT_EQ(Body(scale.get()), "ST,NT+  0.00kg");
  EXPECT_EQ(Bodies(scale->OnBytes("Z\r")), Texts{"\x02OK\x03"});
  EXPECT_EQ(Body(scale.get()), "ST,GS+  0.00kg");
}

TEST(ScaleDevice, DoesNotAnswerWhatItDoesNotKnow) {
  const auto scale = Make("scale");
  const DeviceAnswer answer = scale->OnBytes("X\r");
  EXPECT_EQ(Bodies(answer), Texts());
  ASSERT_EQ(answer.received.size(), 1U);
  EXPECT_EQ(answer.received[0].what, "ignored");
}

TEST(ScaleDevice, DriftsWithTheSeed) {
  const auto weights = [](std::uint64_t seed) {
    DeviceSettings settings;
    settings.seed = seed;
    settings.driftGrams = 50;
    const auto scale = Make("scale", settings);
    Texts bodies;
    for (int i = 0; i < 20; ++i) {
      bodies.push_back(Body(scale.get()));
    }
    return bodies;
  };
  EXPECT_EQ(weights(1), weights(1));
  EXPECT_NE(weights(1), weights(2));
  for (const std::string& body : weights(3)) {
    EXPECT_EQ(body.size(), 14U) << body;
    EXPECT_TRUE(body.substr(0, 2) == "ST" || body.substr(0, 2) == "US") << body;
  }
}

TEST(BarcodeDevice, RepeatsACodeAndHasAGs1Code) {
  const auto scanner = Make("barcode");
  const std::string first = Body(scanner.get());
  EXPECT_EQ(Body(scanner.get()), first);
  EXPECT_NE(Body(scanner.get()), first);
  EXPECT_NE(Body(scanner.get()).find('\x1D'), std::string::npos);
  EXPECT_EQ(Bodies(scanner->OnBytes("t\r")), Texts{"ABC-1234\r\n"});
}

TEST(RfidDevice, SendsDigitsOrBytesWithTheirCheck) {
  DeviceSettings settings;
  settings.isBinary = true;
  const auto digits = Make("rfid");
  const auto bytes = Make("rfid", settings);
  std::set<std::string> cards;
  for (int i = 0; i < 6; ++i) {
    const std::string card = Body(bytes.get());
    EXPECT_EQ(Body(digits.get()), CompactHex(card));
    ASSERT_EQ(card.size(), 6U);
    int check = 0;
    for (const char byte : card) {
      check ^= byte;
    }
    EXPECT_EQ(check, 0);
    cards.insert(card);
  }
  EXPECT_EQ(cards.size(), 4U);
  const auto message = digits->NextMessage();
  EXPECT_EQ(message->framing.suffix, "\r\n\x03");
}

TEST(GaugeDevice, SendsValuesWithoutAnyMark) {
  const auto gauge = Make("gauge");
  const auto message = gauge->NextMessage();
  EXPECT_EQ(message->framing.prefix + message->framing.suffix, "");
  EXPECT_EQ(message->body.size(), 10U) << message->body;
  EXPECT_EQ(message->body.substr(0, 5), "+12.3");
  EXPECT_EQ(message->body.substr(7), " mm");
  EXPECT_EQ(Bodies(gauge->OnBytes("M?\r")).size(), 1U);
}

TEST(PrinterDevice, TakesLabelsAndTellsHowMany) {
  const auto printer = Make("printer");
  EXPECT_EQ(Body(printer.get()), "(none)");
  EXPECT_EQ(Bodies(printer->OnBytes("\x05")), Texts{"\x02READY,0\x03"});
  DeviceAnswer answer = printer->OnBytes("LOT 4711\fsecond\x03^XA third ^X");
  ASSERT_EQ(answer.received.size(), 2U);
  EXPECT_EQ(answer.received[0].bytes, "LOT 4711\f");
  EXPECT_EQ(answer.received[1].bytes, "second\x03");
  answer = printer->OnBytes("Z\x05");
  ASSERT_EQ(answer.received.size(), 2U);
  EXPECT_EQ(answer.received[0].what, "label");
  EXPECT_EQ(answer.received[0].bytes, "^XA third ^XZ");
  EXPECT_EQ(Bodies(answer), Texts{"\x02READY,3\x03"});
}

TEST(PrinterDevice, BoundsALabelWithoutEnd) {
  const auto printer = Make("printer");
  const DeviceAnswer answer = printer->OnBytes(std::string(2 * PrinterDevice::kMaxLabelBytes, 'x'));
  EXPECT_EQ(answer.received.size(), 2U);
}

TEST(ModemDevice, EchoesAndAnswers) {
  const auto modem = Make("modem");
  EXPECT_EQ(Bodies(modem->OnBytes("AT\r\n")), (Texts{"AT\r", "\r\nOK\r\n"}));
  EXPECT_EQ(Bodies(modem->OnBytes("at+csq\r")),
            (Texts{"at+csq\r", "\r\n+CSQ: 17,99\r\n", "\r\nOK\r\n"}));
  EXPECT_EQ(Bodies(modem->OnBytes("ATE0\r")), (Texts{"ATE0\r", "\r\nOK\r\n"}));
  EXPECT_EQ(Bodies(modem->OnBytes("ATX\r")), Texts{"\r\nERROR\r\n"});
  EXPECT_EQ(Bodies(modem->OnBytes("hello\r")), Texts{"\r\nERROR\r\n"});
  EXPECT_EQ(Bodies(modem->OnBytes("\r")), Texts());
  EXPECT_EQ(Bodies(modem->OnBytes("ATE1\r")), Texts{"\r\nOK\r\n"});
  const DeviceAnswer answer = modem->OnBytes("AT\r");
  ASSERT_EQ(answer.replies.size(), 2U);
  EXPECT_TRUE(answer.replies[0].isVerbatim);
  EXPECT_FALSE(answer.replies[1].isVerbatim);
  EXPECT_EQ(Body(modem.get()), "RING");
}

TEST(DeviceCatalogue, TextsReplaceWhatEveryDeviceSends) {
  DeviceSettings settings;
  settings.texts = {"one", "two"};
  for (const DeviceKind& kind : DeviceKinds()) {
    settings.framing = kind.framing;
    const auto device = kind.make(settings);
    EXPECT_EQ(Body(device.get()), "one") << kind.name;
    EXPECT_EQ(Body(device.get()), "two") << kind.name;
    const auto message = device->NextMessage();
    EXPECT_EQ(message->body, "one") << kind.name;
    EXPECT_EQ(message->framing.suffix, kind.framing.suffix) << kind.name;
  }
}

TEST(DeviceCatalogue, TellsHowToReceive) {
  const DeviceKind& scale = DeviceKinds().front();
  DeviceSettings settings;
  settings.framing = scale.framing;
  EXPECT_EQ(ConfigurationFor(scale, settings),
            "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=7 stopbits=1 mode=RS-232 "
            "rx_prefix=02 rx_suffix=03 tx_suffix=0D0A");
  EXPECT_EQ(ConfigArgumentsFor(scale, settings),
            "-b 9600 -p even -d 7 -s 1 --rx-prefix 02 --rx-suffix 03 --tx-suffix 0D0A");
  settings.isBinary = true;
  settings.framing = {};
  EXPECT_EQ(ConfigArgumentsFor(scale, settings),
            "-b 9600 -p even -d 7 -s 1 --tx-suffix 0D0A --hex");
}

}  // namespace
