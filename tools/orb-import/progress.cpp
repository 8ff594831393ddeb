// SPDX-License-Identifier: MIT
#include "progress.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <string_view>
#include <vector>

#include "text.h"

namespace orbimport {
namespace {

constexpr auto kBetweenDraws = std::chrono::milliseconds(100);
constexpr std::size_t kSmallestBar = 10;
constexpr std::size_t kLargestBar = 40;

std::string Percent(double share) {
  // Not 100 before it is.
  const auto percent = static_cast<unsigned>(share * 100);
  return std::string(percent < 10 ? 2 : percent < 100 ? 1 : 0, ' ') + std::to_string(percent) + "%";
}

double ShareOf(const ProgressState& state) {
  if (state.all.bytes > 0) {
    return std::min(1.0,
                    static_cast<double>(state.done.bytes) / static_cast<double>(state.all.bytes));
  }
  if (state.all.files == 0) return 1;
  return static_cast<double>(state.done.files) / static_cast<double>(state.all.files);
}

std::vector<std::string> Texts(const ProgressState& state) {
  std::vector<std::string> texts = {
      Percent(ShareOf(state)),
      std::to_string(state.done.files) + "/" + std::to_string(state.all.files) + " files",
      FormatBytes(state.done.bytes) + " of " + FormatBytes(state.all.bytes)};
  if (state.bytesPerSecond < 1) return texts;
  const std::uint64_t left = state.all.bytes - std::min(state.all.bytes, state.done.bytes);
  const double seconds = std::ceil(static_cast<double>(left) / state.bytesPerSecond);
  texts.push_back(FormatBytes(static_cast<std::uint64_t>(state.bytesPerSecond)) + "/s");
  if (seconds < 360000)
    texts.push_back(FormatDuration(static_cast<std::uint64_t>(seconds)) + " left");
  return texts;
}

std::string Bar(double share, std::size_t width, bool color) {
  const std::size_t cells = width - 2;
  const auto full = static_cast<std::size_t>(share * static_cast<double>(cells));
  const std::string filled(full, '#');
  return "[" + (color ? "\x1b[32m" + filled + "\x1b[0m" : filled) + std::string(cells - full, '-') +
         "]";
}

std::size_t TerminalWidth() {
  winsize size = {};
  if (::ioctl(STDERR_FILENO, TIOCGWINSZ, &size) != 0 || size.ws_col == 0) return 80;
  return size.ws_col;
}

bool HasValue(const char* name) {
  const char* const value = std::getenv(name);
  return value != nullptr && *value != '\0';
}

}  // namespace

std::string ProgressLine(const ProgressState& state, std::size_t width, bool color) {
  std::string line;
  for (const std::string& text : Texts(state)) {
    const std::size_t gap = line.empty() ? 0 : 2;
    if (line.size() + gap + text.size() > width) break;
    line += std::string(gap, ' ') + text;
  }
  if (line.size() + 1 + kSmallestBar > width) return line;
  return Bar(ShareOf(state), std::min(width - line.size() - 1, kLargestBar), color) + " " + line;
}

double SmoothRate(double rate, double bytes, double seconds) {
  if (seconds <= 0) return rate;
  const double now = bytes / seconds;
  return rate <= 0 ? now : rate + (now - rate) * (1 - std::exp(-seconds / 2));
}

Progress::Form Progress::FormFor(bool quiet) {
  if (quiet) return Form::kNone;
  const char* const terminal = std::getenv("TERM");
  const bool isDumb = terminal != nullptr && std::string_view(terminal) == "dumb";
  return ::isatty(STDERR_FILENO) != 0 && !isDumb ? Form::kBar : Form::kLines;
}

Progress::Progress(Form form) : form_(form), color_(!HasValue("NO_COLOR")) {}

void Progress::Begin(const Totals& all) {
  state_.all = all;
  if (form_ == Form::kBar) Draw(Clock::now());
}

void Progress::Advance(std::uint64_t bytes) {
  state_.done.bytes += bytes;
  moved_ += bytes;
  DrawIfDue();
}

void Progress::EndFile(std::uint64_t size, const std::string& line) {
  ++state_.done.files;
  bytesBefore_ += size;
  state_.done.bytes = bytesBefore_;
  if (form_ == Form::kLines) {
    std::fprintf(stderr,
                 "%llu/%llu %s\n",
                 static_cast<unsigned long long>(state_.done.files),
                 static_cast<unsigned long long>(state_.all.files),
                 line.c_str());
  }
  DrawIfDue();
}

void Progress::Say(const char* what) {
  if (form_ != Form::kBar) return;
  Hide();
  std::fputs(what, stderr);
  visible_ = true;
}

void Progress::Hide() {
  if (visible_) std::fputs("\r\x1b[K", stderr);
  visible_ = false;
}

void Progress::DrawIfDue() {
  if (form_ != Form::kBar) return;
  const auto now = Clock::now();
  if (now - drawn_ >= kBetweenDraws) Draw(now);
}

void Progress::Draw(Clock::time_point now) {
  const double seconds = std::chrono::duration<double>(now - drawn_).count();
  state_.bytesPerSecond =
      SmoothRate(state_.bytesPerSecond, static_cast<double>(moved_ - movedAtDraw_), seconds);
  movedAtDraw_ = moved_;
  drawn_ = now;
  // The last column stays free: some terminals break the line there.
  const std::string line = ProgressLine(state_, TerminalWidth() - 1, color_);
  std::fprintf(stderr, "\r%s\x1b[K", line.c_str());
  visible_ = true;
}

}  // namespace orbimport
