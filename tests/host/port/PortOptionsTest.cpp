// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

#include "host/port/PortOptions.h"

namespace {

PortOptions Parsed(const std::string& text) {
  PortOptions options;
  std::string error;
  EXPECT_TRUE(ParsePortOptions(text, &options, &error)) << text << ": " << error;
  return options;
}

std::string ErrorOf(const std::string& text) {
  PortOptions options = PortOptions::For("before");
  std::string error;
  EXPECT_FALSE(ParsePortOptions(text, &options, &error)) << text;
  EXPECT_EQ(options.path, "before") << text;
  return error;
}

TEST(PortOptions, PathAlone) {
  EXPECT_EQ(Parsed("/dev/ttyUSB0").path, "/dev/ttyUSB0");
  EXPECT_EQ(Parsed("pty:/tmp/scale").path, "/tmp/scale");
  EXPECT_EQ(Parsed("/dev/serial/by-id/a=b").path, "/dev/serial/by-id/a=b");
}

TEST(PortOptions, EveryOption) {
  const PortOptions options = Parsed(
      "/dev/x,flow=rtscts,dtr=on,rts=keep,rs485=ioctl,echo=strip,flush=on,txdelay=25,"
      "latency=keep,hupcl=off,reconnect=off");
  EXPECT_EQ(options.path, "/dev/x");
  EXPECT_EQ(options.flow, PortOptions::Flow::kRtsCts);
  EXPECT_EQ(options.dtr, PortOptions::Level::kOn);
  EXPECT_EQ(options.rts, PortOptions::Level::kKeep);
  EXPECT_EQ(options.rs485, PortOptions::Rs485::kIoctl);
  EXPECT_TRUE(options.stripsEcho);
  EXPECT_TRUE(options.flushesOnOpen);
  EXPECT_EQ(options.txDelayMs, 25);
  EXPECT_FALSE(options.isLowLatency);
  EXPECT_EQ(options.hupcl, PortOptions::Level::kOff);
  EXPECT_FALSE(options.reconnects);
  EXPECT_EQ(Parsed("/dev/x,flow=xonxoff").flow, PortOptions::Flow::kXonXoff);
  EXPECT_EQ(Parsed("/dev/x,rts=off").rts, PortOptions::Level::kOff);
  EXPECT_EQ(Parsed("/dev/x,rs485=rts").rs485, PortOptions::Rs485::kRts);
  EXPECT_EQ(Parsed("/dev/x,rs485=off").rs485, PortOptions::Rs485::kOff);
}

TEST(PortOptions, FirstValueOfTheTableIsTheDefault) {
  std::string words = "/dev/x";
  for (const PortOptionEntry& entry : PortOptionTable()) {
    const std::string values = entry.values;
    words += std::string(",") + entry.name + "=" + values.substr(0, values.find_first_of("| "));
  }
  const PortOptions given = Parsed(words);
  const PortOptions plain = Parsed("/dev/x");
  EXPECT_EQ(given.flow, plain.flow);
  EXPECT_EQ(given.dtr, plain.dtr);
  EXPECT_EQ(given.rts, plain.rts);
  EXPECT_EQ(given.rs485, plain.rs485);
  EXPECT_EQ(given.stripsEcho, plain.stripsEcho);
  EXPECT_EQ(given.flushesOnOpen, plain.flushesOnOpen);
  EXPECT_EQ(given.txDelayMs, plain.txDelayMs);
  EXPECT_EQ(given.isLowLatency, plain.isLowLatency);
  EXPECT_EQ(given.hupcl, plain.hupcl);
  EXPECT_EQ(given.reconnects, plain.reconnects);
}

TEST(PortOptions, EveryValueOfTheTableIsTaken) {
  for (const PortOptionEntry& entry : PortOptionTable()) {
    const std::string values = entry.values;
    for (std::size_t begin = 0; begin < values.size() && values.find('|') != std::string::npos;) {
      const std::size_t end = std::min(values.find('|', begin), values.size());
      (void)Parsed("/dev/x," + std::string(entry.name) + "=" + values.substr(begin, end - begin));
      begin = end + 1;
    }
  }
}

TEST(PortOptions, ErrorsNameTheOptionAndWhatItTakes) {
  EXPECT_EQ(ErrorOf("/dev/x,flow=hard"), "flow=hard: expected none|rtscts|xonxoff");
  EXPECT_EQ(ErrorOf("/dev/x,flow"), "flow=: expected none|rtscts|xonxoff");
  EXPECT_EQ(ErrorOf("/dev/x,txdelay=1001"), "txdelay=1001: expected 0 to 1000 ms");
  EXPECT_EQ(ErrorOf("/dev/x,txdelay=-1"), "txdelay=-1: expected 0 to 1000 ms");
  EXPECT_EQ(ErrorOf("/dev/x,txdelay="), "txdelay=: expected 0 to 1000 ms");
  EXPECT_EQ(ErrorOf("/dev/x,speed=9600"),
            "'speed' is no port option; flow, dtr, rts, rs485, echo, flush, txdelay, latency, "
            "hupcl, reconnect are");
  EXPECT_EQ(ErrorOf("/dev/x,").rfind("'' is no port option", 0), 0U);
  EXPECT_EQ(ErrorOf("/dev/x,dtr=on,dtr=on"), "dtr is given twice");
  EXPECT_EQ(ErrorOf(""), "a port needs a path");
  EXPECT_EQ(ErrorOf("pty:"), "a port needs a path");
  EXPECT_EQ(ErrorOf(",flow=none"), "a port needs a path");
}

TEST(PortOptions, RefusesWhatContradictsItself) {
  EXPECT_EQ(ErrorOf("/dev/x,flow=rtscts,rs485=rts"),
            "flow=rtscts and rs485=rts both want the RTS line");
  EXPECT_EQ(ErrorOf("/dev/x,flow=rtscts,rts=on"),
            "rts is switched by flow=rtscts; leave out one of the two");
  EXPECT_EQ(ErrorOf("/dev/x,rts=off,rs485=rts"),
            "rts is switched by rs485=rts; leave out one of the two");
}

TEST(PortOptions, DescriptionHasALineForEachOption) {
  const auto lines = DescribePortOptions();
  ASSERT_EQ(lines.size(), PortOptionTable().size());
  EXPECT_EQ(lines[0].rfind("flow=none|rtscts|xonxoff ", 0), 0U);
  for (const std::string& line : lines) {
    EXPECT_LE(line.size(), 100U) << line;
  }
}

TEST(PortOptions, DocumentHasARowForEachOption) {
  std::ifstream file(LOKA_SOURCE_DIR "/docs/ports.md");
  const std::string document{std::istreambuf_iterator<char>(file), {}};
  for (const PortOptionEntry& entry : PortOptionTable()) {
    std::string values;
    for (const char letter : std::string(entry.values)) {
      values += letter == '|' ? ", " : std::string(1, letter);
    }
    const std::string row =
        "| `" + std::string(entry.name) + "` | " + values + " | " + entry.help + " |\n";
    EXPECT_NE(document.find(row), std::string::npos) << row;
  }
}

}  // namespace
