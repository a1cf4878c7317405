// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <CLI/CLI.hpp>
#include <string>

// How --help looks: the list of all commands on one screen of 24 lines by 80 columns, the options
// of one command in lines of at most kMaxHelpColumns. Main thread.
class HelpText final : public CLI::Formatter {
 public:
  static constexpr std::size_t kMaxHelpColumns = 100;

  // The program's own help when `app` has no parent, else that of one command.
  std::string make_help(const CLI::App* app, std::string name,
                        CLI::AppFormatMode mode) const override;

  std::string make_option(const CLI::Option* option, bool isPositional) const override;

  std::string make_footer(const CLI::App* app) const override;

  // Without the options that exclude this one.
  std::string make_option_opts(const CLI::Option* option) const override;
};
