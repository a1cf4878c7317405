// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

struct PortOptions;
struct termios;

// The numbers of a serial line as ISerialPort::Setup passes them.
struct LineSettings {
  int baudrate = 9600;  // bits a second
  int parity = 0;       // SerialParity
  int dataBits = 8;     // 7 or 8
  int stopBits = 1;     // 1 or 2
  int mode = 0;         // SerialMode
};

// What stands in the way of these settings, in words, or the empty text when they are all valid:
// one of the eleven rates from 150 to 115200 baud, parity code 0 to 4, 7 or 8 data bits, 1 or 2
// stop bits, mode code 0 to 3. Any thread.
std::string WhyInvalid(const LineSettings& settings);

// Puts the raw mode into `line`: no translation, echo, signals or flow control, modem lines
// ignored (CLOCAL), a read waits for one byte (VMIN 1, VTIME 0; termios(3)). Rate and character
// format stay as they are, and so does HUPCL, which decides what closing does to DTR. Bytes with a
// parity error are passed on as they come (INPCK is off). Any thread.
void BuildRawMode(termios* line);

// Raw mode plus rate and character format. Mark and space parity use CMSPAR (termios(3)). Returns
// false and leaves `line` alone when the settings are not valid. Any thread.
bool BuildTermios(const LineSettings& settings, termios* line);

// Adds what the port's options say about flow control and about closing (CRTSCTS, IXON and IXOFF,
// HUPCL; termios(3)) to a raw line. Any thread.
void AddLineOptions(const PortOptions& options, termios* line);

// "9600 7E1 RS-232". Any thread.
std::string DescribeLine(const LineSettings& settings);

// Milliseconds that lengthBytes bytes take on the line, start, parity and stop bits included,
// rounded up. Any thread.
long long LineTimeMs(const LineSettings& settings, long long lengthBytes);
