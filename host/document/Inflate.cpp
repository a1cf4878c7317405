// SPDX-License-Identifier: Apache-2.0
#include "host/document/Inflate.h"

#include <zlib.h>

#include <vector>

namespace {

constexpr std::size_t kChunkBytes = 16UL * 1024;

class InflateState {
 public:
  explicit InflateState(std::string_view stream) : input_(stream.begin(), stream.end()) {
    state_.next_in = input_.data();
    state_.avail_in = static_cast<uInt>(input_.size());
    isReady_ = inflateInit(&state_) == Z_OK;
  }
  ~InflateState() {
    if (isReady_) {
      (void)inflateEnd(&state_);
    }
  }
  InflateState(const InflateState&) = delete;
  InflateState& operator=(const InflateState&) = delete;

  bool IsReady() const { return isReady_; }
  uInt BytesLeft() const { return state_.avail_in; }

  // Appends the next bytes. zlib's result.
  int Next(std::string* text) {
    std::vector<unsigned char> chunk(kChunkBytes);
    state_.next_out = chunk.data();
    state_.avail_out = static_cast<uInt>(chunk.size());
    const int result = inflate(&state_, Z_NO_FLUSH);
    text->append(
        chunk.begin(),
        chunk.end() - static_cast<std::vector<unsigned char>::difference_type>(state_.avail_out));
    return result;
  }

 private:
  std::vector<unsigned char> input_;
  z_stream state_{};
  bool isReady_ = false;
};

}  // namespace

bool Inflate(std::string_view stream, int maxBytes, std::string* text, std::string* error) {
  InflateState state(stream);
  if (!state.IsReady()) {
    *error = "no memory to inflate the document";
    return false;
  }
  std::string inflated;
  int result = Z_OK;
  while (result == Z_OK && inflated.size() <= static_cast<std::size_t>(maxBytes)) {
    result = state.Next(&inflated);
  }
  if (inflated.size() > static_cast<std::size_t>(maxBytes)) {
    *error = "the document inflates to more than " + std::to_string(maxBytes) + " bytes";
  } else if (result == Z_BUF_ERROR) {
    *error = "the compressed document ends early";
  } else if (result != Z_STREAM_END) {
    *error = "the compressed document is no whole zlib stream";
  } else if (state.BytesLeft() != 0) {
    *error = "the compressed document ends " + std::to_string(state.BytesLeft()) +
             " bytes before its stated length";
  } else {
    *text = std::move(inflated);
    return true;
  }
  return false;
}
