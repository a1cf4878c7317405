// SPDX-License-Identifier: Apache-2.0
// The completion files in the shells that they are for.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <set>

#include "host/base/ChildProcess.h"
#include "host/base/Deadline.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kShellLimitMs = 60000;

using Words = std::set<std::string>;

// The parameter of a test; its name is printed instead of its bytes.
struct Offer {
  const char* name;
  const char* line;  // words with one blank between; the cursor stands at its end
  Words all;         // exactly these; "..." among them: and others
};

// The plug-in, two profiles and one instance of the test are what there is.
const Offer kOffers[] = {
    {"Command", "loka su", {"sub"}},
    {"NestedCommand", "loka config n", {"new"}},
    {"BehindAnOption", "loka --plugin x su", {"sub"}},
    {"Option", "loka sub --tx", {"--tx-prefix", "--tx-suffix"}},
    {"OptionOfOneDevice", "loka sim scale --dri", {"--drift"}},
    {"Parity", "loka sub -p ", {"none", "even", "odd", "mark"}},
    {"Rate", "loka run --baud 19", {"19200"}},
    {"Mode", "loka sub --mode RS-4", {"RS-485", "RS-422"}},
    {"ControlName", "loka sub --rx-prefix ST", {"STX"}},
    {"FixedChoice", "loka connect ", {"on", "off", "status"}},
    {"Shell", "loka completion ", {"bash", "zsh", "fish"}},
    {"Setting", "loka set ba", {"baud="}},
    {"StoredSetting", "loka store get ba", {"baud"}},
    {"Console", "loka cmd get_t", {"get_token_length"}},
    {"Address", "loka read 0?tok", {"0?tokens_available?unsignedInt", "0?token_ack?boolean"}},
    {"Profile", "loka sub --profile ga", {"gate"}},
    {"ProfileForThePort", "loka sub sca", {"scale"}},
    {"Instance", "loka stats --instance co", {"com7"}},
    {"File", "loka config check setu", {"setup.cfg"}},
};

void PrintTo(const Offer& offer, std::ostream* stream) { *stream << offer.line; }

std::string PathOf(const std::string& shell) {
  for (const char* const folder : {"/usr/bin/", "/bin/"}) {
    if (std::filesystem::exists(folder + shell)) {
      return folder + shell;
    }
  }
  return "";
}

class CompletionTest : public ::testing::TestWithParam<Offer> {
 protected:
  void SetUp() override {
    std::filesystem::create_directories(folder_.File("config/loka"));
    std::filesystem::create_directories(folder_.File("control"));
    std::ofstream(folder_.File("config/loka/config.toml"))
        << "[scale]\nport = /dev/a\n[gate]\nport = /dev/b\n";
    std::ofstream(folder_.File("control/com7.sock")) << "";
    std::ofstream(folder_.File("setup.cfg")) << "";
    std::filesystem::create_symlink(LOKA_PROGRAM_PATH, folder_.File("loka"));
  }

  // The words that a shell's script prints.
  Words Run(const std::string& shell, const std::string& script,
            const std::vector<std::string>& arguments) const {
    const std::string path = PathOf(shell);
    EXPECT_NE(path, "") << shell << " is not installed";
    std::ofstream(folder_.File("script")) << script;
    const std::string folder = folder_.Path().string();
    std::vector<std::string> words = {
        "sh", "-c",
        "cd '" + folder + "'; export PATH='" + folder + "':\"$PATH\" HOME='" + folder +
            "' XDG_CONFIG_HOME='" + folder + "/config' LOKA_RUNTIME_DIR='" + folder +
            "/control' LOKA_PLUGIN='" + PluginLibrary::DefaultPath() +
            "' TERM=dumb; loka completion " + shell +
            (shell == "zsh" ? " >_loka" : " >completion") + "; exec \"$0\" \"$@\" 2>errors"};
    words.push_back(path);
    words.insert(words.end(), arguments.begin(), arguments.end());
    ChildProcess process("/bin/sh", words);
    Words offered;
    const Deadline deadline = Deadline::After(kShellLimitMs);
    for (std::string line; process.ReadLine(deadline, &line);) {
      offered.insert(line);
    }
    EXPECT_EQ(process.Wait(deadline), 0);
    offered.erase("");
    return offered;
  }

  const TemporaryFolder folder_;
};

TEST_P(CompletionTest, OfBash) {
  // As bash cuts the line; a blank at the end begins an empty word.
  const Words offered = Run("bash", R"sh(
source ./completion
line=$1
read -ra COMP_WORDS <<<"$line"
[[ $line == *' ' ]] && COMP_WORDS+=('')
COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
_loka loka
for word in "${COMPREPLY[@]}"; do eval "echo $word"; done
)sh",
                            {"--norc", "script", GetParam().line});
  EXPECT_EQ(offered, GetParam().all);
}

TEST_P(CompletionTest, OfFish) {
  Words offered;
  // Behind a tabulator stands the help.
  for (const std::string& line : Run("fish", "source ./completion\ncomplete -C $argv[1]\n",
                                     {"--no-config", "script", GetParam().line})) {
    offered.insert(line.substr(0, line.find('\t')));
  }
  EXPECT_EQ(offered, GetParam().all);
}

TEST_P(CompletionTest, OfZsh) {
  // What a person types there in place of a question mark, which stands for any character.
  std::string line = GetParam().line;
  if (const std::size_t at = line.find('?'); at != std::string::npos) {
    line.insert(at, "\\");
  }
  // A shell in a terminal of its own; what would be added is printed between marks.
  const Words offered = Run("zsh", R"zsh(
zmodload zsh/zpty
zpty shell zsh -f -i
zpty -w shell "PS1=; fpath=($PWD \$fpath); autoload -Uz compinit && compinit -D -u"
zpty -w shell 'compadd () { local -a found; if [[ ${@[1,(i)(-|--)]} == *-(O|A|D)\ * ]]; then builtin compadd "$@"; return; fi; builtin compadd -A found "$@"; print -rl -- "<<"${^found}">>" }'
zpty -w shell 'end-of-words () { print -r -- END-OF-WORDS; exit }'
zpty -w shell 'show-words () { local -a comppostfuncs=(end-of-words); _main_complete }'
zpty -w shell 'zle -C show-words complete-word show-words; bindkey "^I" show-words; print READY'
zpty -r shell line '*READY*READY*'
zpty -w -n shell "$1"$'\t'
while zpty -r shell line; do
  [[ $line == *END-OF-WORDS* ]] && break
  [[ $line == *'<<'*'>>'* ]] && print -r -- "${(Q)${${line##*<<}%%>>*}}"
done
true
)zsh",
                            {"-f", "script", line});
  EXPECT_EQ(offered, GetParam().all);
}

std::string NameOf(const ::testing::TestParamInfo<Offer>& offer) { return offer.param.name; }

INSTANTIATE_TEST_SUITE_P(Words, CompletionTest, ::testing::ValuesIn(kOffers), NameOf);

}  // namespace
