// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <cstdio>
#include <string>

namespace orbimport {

struct Totals {
  std::uint64_t files = 0;
  std::uint64_t bytes = 0;
};

struct ProgressState {
  Totals done;
  Totals all;
  double bytesPerSecond = 0;  // 0 while it is not known.
};

/// One line of at most `width` columns, all of them ASCII: bar, percent, files, bytes, rate and
/// remaining time. Where there is no room for all, the bar goes first, then what stands last.
std::string ProgressLine(const ProgressState& state, std::size_t width, bool color);

/// A rate from what was done since the last look, smoothed over about two seconds.
double SmoothRate(double rate, double bytes, double seconds);

/// Tells on stderr how far an import is: with a bar of one line on a terminal, with a line a file
/// elsewhere, or not at all.
class Progress {
 public:
  enum class Form { kNone, kBar, kLines };

  /// The form that suits stderr as it is.
  static Form FormFor(bool quiet);

  explicit Progress(Form form);

  void Begin(const Totals& all);
  /// Some bytes more of the file at work. Draws at most ten times a second.
  void Advance(std::uint64_t bytes);
  /// The file at work is done with, whatever became of it; `size` bytes of all are behind us.
  void EndFile(std::uint64_t size, const std::string& line);
  /// Says something that takes its time, in place of the bar.
  void Say(const char* what);
  /// Clears the line of the bar, so that something else can be printed.
  void Hide();

 private:
  using Clock = std::chrono::steady_clock;

  void DrawIfDue();
  void Draw(Clock::time_point now);

  Form form_;
  bool color_;
  bool visible_ = false;
  ProgressState state_;
  std::uint64_t bytesBefore_ = 0;  // Of the files that are done with.
  std::uint64_t moved_ = 0;        // Really copied, for the rate.
  std::uint64_t movedAtDraw_ = 0;
  Clock::time_point drawn_;
};

}  // namespace orbimport
