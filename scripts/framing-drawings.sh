#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Makes the framing drawings of the manual: scripts/framing-drawings.sh [FOLDER], by default
# docs/images. Needs bash, awk and coreutils.
#
# A drawing is two lines below. The first one: "drawing", file name, receive prefix, receive suffix,
# gap. The second one is what happens on the line, in the order of time:
#
#   41        a byte; with a number and "*" in front, so many of them
#   02p 03s   a byte of the prefix, of the suffix
#   _200      a pause of 200 ms
#   [ ]       around the bytes of a token
#   {why }    around bytes that are dropped, with the reason ("_" for a blank)
#   ^         a token enters the queue
#
# The pictures are drawn from this alone; a test feeds the same bytes and pauses to the driver.

set -euo pipefail
folder=${1:-$(cd "$(dirname "$0")/.." && pwd)/docs/images}
mkdir -p "$folder"

drawings() {
  cat <<'LINES'
drawing prefix-and-suffix 02 03 0
{no_prefix 55 } 02p [ 41 42 ] 03s ^ _200 02p [ 43 _300 44 ] 03s ^ _200 {no_suffix 02 45 } _600
drawing prefix-and-suffix-gap 02 03 50
02p [ 41 _30 42 ] 03s ^ _200 {no_suffix 02 43 } _80 {no_prefix 44 03 } _200
drawing prefix-only 02 none 0
{no_prefix 55 } 02p [ 41 ] 02p ^ [ 42 _300 43 ] _600 ^ {no_prefix 44 } _600
drawing prefix-only-gap 02 none 50
02p [ 41 _30 42 ] 02p ^ [ 43 ] _80 ^ {no_prefix 44 } 02p [ 45 ] _80 ^
drawing suffix-only none 0D 0
[ 41 42 ] 0Ds ^ [ 43 _300 44 ] 0Ds ^ {no_suffix 45 46 } _600 [ 47 ] 0Ds ^
drawing suffix-only-gap none 0D 50
[ 41 _30 42 ] 0Ds ^ _200 {no_suffix 43 } _80 [ 44 ] 0Ds ^
drawing silence-only none none 0
[ 41 42 _300 43 ] _600 ^ [ 44 ] _600 ^
drawing silence-only-gap none none 50
[ 41 _30 42 ] _80 ^ [ 43 44 ] _80 ^
drawing prefix-restart 0202 03 0
{no_match 02 05 } 02p 02p [ 41 ] 03s ^ _600
drawing prefix-missed 020203 0D 0
{the_match_starts_again_at_the_third_02 02 02 02 03 41 0D } _600 02p 02p 03p [ 42 ] 0Ds ^
drawing prefix-overlap 0202 none 0
02p 02p [ ] 02p ^ [ 41 ] _600 ^
drawing empty-token 02 none 0
02p [ ] 02p ^ [ 41 ] _600 ^
drawing too-long none 0D 0
{more_than_1000_bytes 1001*41 } [ 42 ] 0Ds ^ _600
LINES
}

drawings | awk -v folder="$folder" '
function Escape(text) {
  gsub(/&/, "\\&amp;", text)
  gsub(/</, "\\&lt;", text)
  gsub(/>/, "\\&gt;", text)
  return text
}

# The name or character that the hexadecimal text of a byte stands for.
function NameOf(hex) { return (hex in names) ? names[hex] : "" }

function Add(line) { body = body "  " line "\n" }

function Text(class, x, y, text) {
  Add("<text class=\"" class "\" x=\"" x "\" y=\"" y "\">" Escape(text) "</text>")
}

function Box(kind, label, name, width) {
  Add("<rect class=\"byte " kind "\" x=\"" (x + 1) "\" y=\"64\" width=\"" (width - 2) \
      "\" height=\"28\" rx=\"3\"/>")
  if (kind == "drop")  # the label needs a plain ground on the hatching
    Add("<rect class=\"plain\" x=\"" (x + width / 2 - 4 * length(label) - 1) \
        "\" y=\"70\" width=\"" (8 * length(label) + 2) "\" height=\"16\"/>")
  Text("name", x + width / 2, 58, name)
  Text("hex " kind, x + width / 2, 83, label)
  x += width
}

function Byte(item,    count, hex, last, kind) {
  count = 1
  if (index(item, "*") > 0) {
    count = item
    sub(/\*.*/, "", count)
    sub(/.*\*/, "", item)
  }
  hex = substr(item, 1, 2)
  last = substr(item, 3, 1)
  kind = dropping ? "drop" : last == "p" ? "prefix" : last == "s" ? "suffix" : "body"
  if (kind == "body") token = token NameOf(hex)
  if (count > 1) Box(kind, count " x " hex, NameOf(hex), 112)
  else Box(kind, hex, NameOf(hex), 34)
}

function Pause(ms,    width, ends) {
  ends = ms >= limit
  width = ends ? 96 : 62
  if (ends)
    Add("<rect class=\"silence\" x=\"" (x + 2) "\" y=\"64\" width=\"" (width - 4) \
        "\" height=\"28\"/>")
  Text("pause", x + width / 2, 83, ms " ms")
  if (ends) Text("name", x + width / 2, 58, "silence")
  x += width
  # The driver acts when the gap is over, not at the end of the silence.
  event = ends ? x - width + width * limit / ms : x
}

function Bracket(class, from, to) {
  Add("<path class=\"" class "\" d=\"M" from " 118v6H" to "v-6\"/>")
}

function Render(items,    count, part, i, item, start, reason, words) {
  body = ""
  x = 20
  dropping = 0
  count = split(items, part, " ")
  for (i = 1; i <= count; ++i) {
    item = part[i]
    if (item == "[") {
      start = x
      token = ""
    } else if (item == "]") {
      Bracket("bracket", start == x ? x - 3 : start + 3, start == x ? x + 3 : x - 3)
      Text("token", (start + x) / 2, 139, "\"" token "\"")
    } else if (item == "^") {
      Add("<path class=\"queued\" d=\"M" event " 104l6 10h-12z\"/>")
    } else if (substr(item, 1, 1) == "{") {
      reason = substr(item, 2)
      gsub(/_/, " ", reason)
      start = x
      dropping = 1
    } else if (item == "}") {
      dropping = 0
      Bracket("lost", start + 3, x - 3)
      words = "dropped: " reason
      Text("reason", start + 3, 157, words)
      if (start + 7 * length(words) > widest) widest = start + 7 * length(words)
    } else if (substr(item, 1, 1) == "_") {
      Pause(substr(item, 2) + 0)
    } else {
      Byte(item)
      event = x
    }
  }
}

function Style() {
  return "  <style>\n" \
    "    text { font-family: \"DejaVu Sans\", Verdana, sans-serif; font-size: 12px; fill: #1f2328; }\n" \
    "    .setting, .hex, .token { font-family: \"DejaVu Sans Mono\", Menlo, monospace; font-size: 13px; }\n" \
    "    .name, .hex, .pause, .token { text-anchor: middle; }\n" \
    "    .name { font-size: 10px; }\n" \
    "    .card { fill: #ffffff; stroke: #d0d7de; }\n" \
    "    .prefix, .suffix { fill: #fde9c8; stroke: #b45309; }\n" \
    "    .body { fill: #dbeafe; stroke: #2563eb; }\n" \
    "    .drop { fill: url(#hatch); stroke: #6b7280; }\n" \
    "    .plain { fill: #ffffff; }\n" \
    "    .hatch { stroke: #9aa1ab; stroke-width: 2; }\n" \
    "    .silence { fill: #eef1f4; stroke: #6b7280; stroke-dasharray: 3 3; }\n" \
    "    .axis, .bracket, .lost { fill: none; stroke: #57606a; }\n" \
    "    .bracket { stroke: #2563eb; stroke-width: 2; }\n" \
    "    .arrow { fill: #57606a; }\n" \
    "    .queued { fill: #15803d; }\n" \
    "    text.hex { fill: #1f2328; stroke: none; }\n" \
    "    @media (prefers-color-scheme: dark) {\n" \
    "      text, text.hex { fill: #e6edf3; }\n" \
    "      .card, .plain { fill: #161b22; }\n" \
    "      .card { stroke: #3d444d; }\n" \
    "      .prefix, .suffix { fill: #4d3410; stroke: #e3a04f; }\n" \
    "      .body { fill: #173766; stroke: #79a8f5; }\n" \
    "      .hatch { stroke: #6b7280; }\n" \
    "      .silence { fill: #262c36; stroke: #9aa1ab; }\n" \
    "      .axis, .lost { stroke: #9aa1ab; }\n" \
    "      .arrow { fill: #9aa1ab; }\n" \
    "      .bracket { stroke: #79a8f5; }\n" \
    "      .queued { fill: #4ac26b; }\n" \
    "    }\n" \
    "  </style>\n"
}

function Legend(y) {
  Add("<path class=\"queued\" d=\"M26 " (y - 10) "l6 10h-12z\"/>")
  Text("legend", 38, y, "token enters the queue")
  Add("<rect class=\"byte drop\" x=\"206\" y=\"" (y - 11) "\" width=\"18\" height=\"13\" rx=\"2\"/>")
  Text("legend", 230, y, "dropped")
}

function Setting() {
  return "rx_prefix=" prefix " rx_suffix=" suffix " gap=" gap (gap == 0 ? " (500 ms)" : "")
}

function Write(file, items,    width, end, out) {
  limit = gap == 0 ? 500 : gap
  widest = 380
  Render(items)
  end = x + 14
  Add("<path class=\"axis\" d=\"M14 104H" end "\"/>")
  Add("<path class=\"arrow\" d=\"M" (end + 8) " 104l-9 -4v8z\"/>")
  Text("legend", end + 14, 108, "time")
  Legend(180)
  width = end + 50
  if (widest + 20 > width) width = widest + 20
  out = "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n" \
    "<!-- Made by scripts/framing-drawings.sh; changes belong there. -->\n" \
    "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" width "\" height=\"196\" viewBox=\"0 0 " \
    width " 196\" role=\"img\" aria-labelledby=\"title\">\n" \
    "  <title id=\"title\">Received bytes cut into tokens with " Setting() "</title>\n" Style() \
    "  <defs>\n    <pattern id=\"hatch\" width=\"7\" height=\"7\" patternUnits=\"userSpaceOnUse\"" \
    " patternTransform=\"rotate(45)\">\n      <path class=\"hatch\" d=\"M0 0V7\"/>\n" \
    "    </pattern>\n  </defs>\n" \
    "  <rect class=\"card\" x=\"0.5\" y=\"0.5\" width=\"" (width - 1) "\" height=\"195\" rx=\"8\"/>\n" \
    "  <text class=\"setting\" x=\"20\" y=\"28\">" Setting() "</text>\n" body "</svg>\n"
  printf "%s", out > file
  close(file)
}

BEGIN {
  for (i = 33; i < 127; ++i) names[sprintf("%02X", i)] = sprintf("%c", i)
  names["02"] = "STX"
  names["03"] = "ETX"
  names["0A"] = "LF"
  names["0D"] = "CR"
}

$1 == "drawing" {
  file = folder "/" $2 ".svg"
  prefix = $3
  suffix = $4
  gap = $5
  next
}

{ Write(file, $0) }
'
