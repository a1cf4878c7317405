// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <histedit.h>
#include <langinfo.h>
#include <sys/ioctl.h>
#include <termios.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <cwctype>
#include <exception>
#include <filesystem>
#include <string_view>
#include <utility>

#include "host/term/LineEditor.h"
#include "host/term/TerminalState.h"

namespace {

constexpr int kHistoryLines = 500;
constexpr std::size_t kTabColumns = 8;
constexpr std::size_t kDefaultColumns = 80;
constexpr wchar_t kDelete = 0x7F;

struct CloseFile {
  void operator()(std::FILE* file) const { (void)std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, CloseFile>;

struct EndEditLine {
  void operator()(EditLine* editLine) const { el_end(editLine); }
};

struct EndHistory {
  void operator()(History* history) const { history_end(history); }
};

// A stream of its own: the editor buffers, and closing it must not close the terminal.
File OpenCopy(int fileDescriptor, const char* mode) {
  const int copy = fcntl(fileDescriptor, F_DUPFD_CLOEXEC, 0);
  std::FILE* const file = copy < 0 ? nullptr : fdopen(copy, mode);
  if (file == nullptr && copy >= 0) {
    (void)close(copy);
  }
  return File(file);
}

// The editor works with wide characters of the locale. Without a UTF-8 locale it could not hold
// what people type.
void UseUtf8() {
  (void)std::setlocale(LC_CTYPE, "");
  if (std::strcmp(nl_langinfo(CODESET), "UTF-8") != 0) {
    (void)std::setlocale(LC_CTYPE, "C.UTF-8");
  }
}

// Columns that the editor uses for a character at this column.
std::size_t ColumnsOf(wchar_t character, std::size_t column) {
  if (character == L'\t') {
    return kTabColumns - column % kTabColumns;
  }
  if (character < L' ' || character == kDelete) {
    return 2;  // ^X
  }
  const int width = wcwidth(character);
  if (width >= 0) {
    return static_cast<std::size_t>(width);
  }
  // \U+1234
  std::array<wchar_t, 16> shown{};
  return static_cast<std::size_t>(
      std::max(0, std::swprintf(shown.data(), shown.size(), L"\\U+%04lx",
                                static_cast<unsigned long>(character))));
}

class LibeditLine final : public LineEditor {
 public:
  LibeditLine(int keysDescriptor, File keys, File screen, std::string historyFile)
      : state_(keysDescriptor),
        keysDescriptor_(keysDescriptor),
        keys_(std::move(keys)),
        screen_(std::move(screen)),
        historyFile_(std::move(historyFile)) {}
  ~LibeditLine() override;
  LibeditLine(const LibeditLine&) = delete;
  LibeditLine& operator=(const LibeditLine&) = delete;

  bool Open();

  std::optional<std::string> ReadLine(const NextByte& nextByte) override;
  void SetPrompt(const std::string& prompt) override { prompt_ = prompt; }
  void Hide() override;
  void Show() override;
  std::string TakeTyped() override;
  void StartWith(const std::string& typed) override { start_ = typed; }
  void Remember(const std::string& line) override;

 private:
  static LibeditLine* Of(EditLine* editLine);
  static char* OnPrompt(EditLine* editLine);
  static int OnKey(EditLine* editLine, wchar_t* key);

  int NextKey(wchar_t* key);
  bool Decode(char byte, wchar_t* key);
  void BeginLine();
  void KeepSignalKeysOff() const;
  void FollowSize();
  std::size_t CursorColumns() const;
  void SaveHistory();

  const TerminalState state_;
  const int keysDescriptor_;
  const File keys_;
  const File screen_;
  const std::string historyFile_;
  std::unique_ptr<EditLine, EndEditLine> editLine_;
  std::unique_ptr<History, EndHistory> history_;
  std::string prompt_;
  std::string start_;
  std::size_t columns_ = kDefaultColumns;
  std::mbstate_t decoder_{};

  // While a line is read.
  const NextByte* nextByte_ = nullptr;
  bool isBegun_ = false;
  bool isHidden_ = false;
  bool isUnfinished_ = false;
  std::exception_ptr failure_;
};

bool LibeditLine::Open() {
  editLine_.reset(el_init_fd("loka", keys_.get(), screen_.get(), screen_.get(), keysDescriptor_,
                             fileno(screen_.get()), fileno(screen_.get())));
  history_.reset(history_init());
  if (editLine_ == nullptr || history_ == nullptr) {
    return false;
  }
  EditLine* const editLine = editLine_.get();
  (void)el_set(editLine, EL_CLIENTDATA, this);
  (void)el_set(editLine, EL_PROMPT, OnPrompt);
  (void)el_set(editLine, EL_GETCFN, OnKey);
  (void)el_set(editLine, EL_EDITOR, "emacs");
  (void)el_set(editLine, EL_SIGNAL, 0);
  (void)el_source(editLine, nullptr);
  // What is typed between two lines must not show up twice.
  (void)el_set(editLine, EL_SETTY, "-x", "-echo", nullptr);
  HistEvent event{};
  (void)history(history_.get(), &event, H_SETSIZE, kHistoryLines);
  (void)history(history_.get(), &event, H_SETUNIQUE, 1);
  if (!historyFile_.empty()) {
    (void)history(history_.get(), &event, H_LOAD, historyFile_.c_str());
  }
  (void)el_set(editLine, EL_HIST, history, history_.get());
  return true;
}

LibeditLine::~LibeditLine() { SaveHistory(); }

// Written aside first, so that the file is whole at any time. The library gives it mode 0600.
void LibeditLine::SaveHistory() {
  if (historyFile_.empty() || history_ == nullptr) {
    return;
  }
  std::error_code ignored;
  std::filesystem::create_directories(std::filesystem::path(historyFile_).parent_path(), ignored);
  const std::string aside = historyFile_ + "." + std::to_string(getpid());
  const int descriptor = open(aside.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
  if (descriptor < 0) {
    return;
  }
  (void)close(descriptor);
  HistEvent event{};
  if (history(history_.get(), &event, H_SAVE, aside.c_str()) >= 0) {
    std::filesystem::rename(aside, historyFile_, ignored);
  }
  std::filesystem::remove(aside, ignored);
}

LibeditLine* LibeditLine::Of(EditLine* editLine) {
  void* data = nullptr;
  (void)el_get(editLine, EL_CLIENTDATA, &data);
  return static_cast<LibeditLine*>(data);
}

char* LibeditLine::OnPrompt(EditLine* editLine) { return Of(editLine)->prompt_.data(); }

// The library is C: no exception may pass through it.
int LibeditLine::OnKey(EditLine* editLine, wchar_t* key) {
  LibeditLine* const self = Of(editLine);
  try {
    return self->NextKey(key);
  } catch (...) {
    self->failure_ = std::current_exception();
    self->isUnfinished_ = true;
    return 0;
  }
}

int LibeditLine::NextKey(wchar_t* key) {
  BeginLine();
  for (;;) {
    const std::optional<char> byte = (*nextByte_)();
    if (!byte) {
      isUnfinished_ = true;
      return 0;
    }
    FollowSize();
    if (Decode(*byte, key)) {
      return 1;
    }
  }
}

// True when the byte completes a character. What is no UTF-8 is left out with a beep.
bool LibeditLine::Decode(char byte, wchar_t* key) {
  const std::size_t used = std::mbrtowc(key, &byte, 1, &decoder_);
  if (used == static_cast<std::size_t>(-1)) {
    decoder_ = std::mbstate_t{};
    el_beep(editLine_.get());
    return false;
  }
  if (used == 0) {
    *key = L'\0';
  }
  return used != static_cast<std::size_t>(-2);
}

// The library has prepared the terminal by now.
void LibeditLine::BeginLine() {
  if (isBegun_) {
    return;
  }
  isBegun_ = true;
  KeepSignalKeysOff();
  if (!start_.empty()) {
    Hide();
    (void)el_insertstr(editLine_.get(), start_.c_str());
    start_.clear();
    Show();
  }
}

// A stopped program would lose what the device sends; ctrl-c stays the way to end it.
void LibeditLine::KeepSignalKeysOff() const {
  termios line{};
  if (tcgetattr(keysDescriptor_, &line) == 0) {
    line.c_cc[VSUSP] = _POSIX_VDISABLE;
    line.c_cc[VQUIT] = _POSIX_VDISABLE;
    (void)tcsetattr(keysDescriptor_, TCSANOW, &line);
  }
}

void LibeditLine::FollowSize() {
  winsize size{};
  if (ioctl(fileno(screen_.get()), TIOCGWINSZ, &size) == 0 && size.ws_col > 0 &&
      size.ws_col != columns_) {
    columns_ = size.ws_col;
    el_resize(editLine_.get());
  }
}

// From the start of the prompt to the cursor.
std::size_t LibeditLine::CursorColumns() const {
  const LineInfoW* const line = el_wline(editLine_.get());
  std::size_t column = prompt_.size();
  for (const wchar_t* at = line->buffer; at != line->cursor; ++at) {
    column += ColumnsOf(*at, column);
  }
  return column;
}

void LibeditLine::Hide() {
  if (nextByte_ == nullptr || isHidden_) {
    return;
  }
  isHidden_ = true;
  FollowSize();
  const std::size_t rows = CursorColumns() / columns_;
  std::string keys = "\r";
  if (rows > 0) {
    keys += "\x1B[" + std::to_string(rows) + "A";
  }
  keys += "\x1B[J";
  (void)std::fputs(keys.c_str(), screen_.get());
  (void)std::fflush(screen_.get());
}

void LibeditLine::Show() {
  if (!isHidden_) {
    return;
  }
  isHidden_ = false;
  (void)el_set(editLine_.get(), EL_REFRESH);
  (void)std::fflush(screen_.get());
}

std::string LibeditLine::TakeTyped() {
  if (nextByte_ == nullptr) {
    return "";
  }
  const LineInfo* const line = el_line(editLine_.get());
  std::string typed(line->buffer, line->lastchar);
  const LineInfoW* const wide = el_wline(editLine_.get());
  const auto length = static_cast<int>(wide->lastchar - wide->buffer);
  (void)el_cursor(editLine_.get(), length);
  el_deletestr(editLine_.get(), length);
  return typed;
}

void LibeditLine::Remember(const std::string& line) {
  HistEvent event{};
  if (!line.empty()) {
    (void)history(history_.get(), &event, H_ENTER, line.c_str());
  }
}

std::optional<std::string> LibeditLine::ReadLine(const NextByte& nextByte) {
  nextByte_ = &nextByte;
  isBegun_ = false;
  isUnfinished_ = false;
  int length = 0;
  const char* const line = el_gets(editLine_.get(), &length);
  std::optional<std::string> result;
  if (line != nullptr && length > 0 && !isUnfinished_) {
    result = std::string(line, static_cast<std::size_t>(length));
    while (!result->empty() && (result->back() == '\n' || result->back() == '\r')) {
      result->pop_back();
    }
  } else {
    Hide();
  }
  nextByte_ = nullptr;
  isHidden_ = false;
  if (failure_ != nullptr) {
    std::rethrow_exception(std::exchange(failure_, nullptr));
  }
  return result;
}

}  // namespace

bool LineEditor::IsBuiltIn() { return true; }

std::unique_ptr<LineEditor> LineEditor::Make(int keysDescriptor, int screenDescriptor,
                                             const std::string& historyFile, std::string* error) {
  UseUtf8();
  auto editor = std::make_unique<LibeditLine>(keysDescriptor, OpenCopy(keysDescriptor, "r"),
                                              OpenCopy(screenDescriptor, "w"), historyFile);
  if (!editor->Open()) {
    *error = "the terminal cannot be used for editing lines";
    return nullptr;
  }
  return editor;
}
