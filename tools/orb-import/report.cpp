// SPDX-License-Identifier: MIT
#include "report.h"

#include <chrono>
#include <cstdio>
#include <iomanip>
#include <ostream>
#include <string_view>

#include "paths.h"
#include "text.h"

namespace orbimport {
namespace {

/// One JSON object on one line.
class JsonLine {
 public:
  JsonLine& Text(const char* key, std::string_view value) { return Raw(key, JsonText(value)); }
  JsonLine& Number(const char* key, std::uint64_t value) { return Raw(key, std::to_string(value)); }
  /// A path whose bytes are no UTF-8 stands beside its text as they are, percent-encoded.
  JsonLine& Path(const char* key, const std::string& path) {
    Text(key, path);
    return IsUtf8(path) ? *this : Text((std::string(key) + "_bytes").c_str(), PercentEncode(path));
  }
  std::string Finished() const { return "{" + text_ + "}\n"; }

 private:
  JsonLine& Raw(const char* key, const std::string& value) {
    if (!text_.empty()) text_ += ',';
    text_ += JsonText(key) + ':' + value;
    return *this;
  }

  std::string text_;
};

const char* NameOf(Status status) {
  switch (status) {
    case Status::kCopied:
      return "copied";
    case Status::kPresent:
      return "present";
    case Status::kPlanned:
      return "planned";
    case Status::kTrashed:
      return "trashed";
    case Status::kKept:
      return "kept";
    default:
      return "failed";
  }
}

const char* ReasonOf(SkipReason reason) {
  switch (reason) {
    case SkipReason::kHidden:
      return "hidden";
    case SkipReason::kLink:
      return "link";
    case SkipReason::kSpecial:
      return "not a regular file";
    case SkipReason::kDestination:
      return "the destination itself";
    default:
      return "unknown type";
  }
}

/// 2024-05-01T10:20:30Z
std::string UtcText(const COrbTime& time) {
  using namespace std::chrono;
  constexpr sys_days kStart = year(1904) / January / 1;
  const sys_seconds at = kStart + seconds(WholeSeconds(time));
  const year_month_day date(floor<days>(at));
  const hh_mm_ss<seconds> clock(at - floor<days>(at));
  char text[48];
  std::snprintf(text,
                sizeof text,
                "%04d-%02u-%02uT%02d:%02d:%02dZ",
                static_cast<int>(date.year()),
                static_cast<unsigned>(date.month()),
                static_cast<unsigned>(date.day()),
                static_cast<int>(clock.hours().count()),
                static_cast<int>(clock.minutes().count()),
                static_cast<int>(clock.seconds().count()));
  return text;
}

/// Why a file stays that is no failure of its own.
bool IsHarmless(OrbResult code) {
  return code == kImportErrShotIncomplete || code == kOrbErrSamePath;
}

std::string Counted(std::uint64_t count, const char* what) {
  return std::to_string(count) + " " + what + (count == 1 ? "" : "s");
}

}  // namespace

void Report::Add(Status status, const Item& item, const std::string& destination, OrbResult code) {
  Tally& tally = tallies_[item.type];
  switch (status) {
    case Status::kCopied:
    case Status::kPlanned:
      ++tally.copied;
      tally.copiedBytes += item.size;
      break;
    case Status::kPresent:
      ++tally.present;
      break;
    case Status::kTrashed:
      ++trashed_;
      trashedBytes_ += item.size;
      break;
    case Status::kKept:
      ++kept_;
      break;
    case Status::kFailed:
      ++tally.failed;
  }
  if (code >= kOrbErrFirst && !IsHarmless(code))
    failures_.push_back({options_.source + "/" + item.path, code});
  if (PrintsItems()) PrintItem(NameOf(status), item, destination, code);
}

void Report::AddFailure(const Failure& failure) {
  ++tallies_[TypeOfName(failure.path)].failed;
  failures_.push_back({options_.source + "/" + failure.path, failure.code});
  if (PrintsItems()) PrintOther("failed", failure.path, nullptr, failure.code);
}

void Report::AddSkip(const Skip& skip) {
  ++skips_[skip.reason];
  if (skip.reason == SkipReason::kLink) links_.push_back(options_.source + "/" + skip.path);
  if (PrintsItems()) PrintOther("skipped", skip.path, ReasonOf(skip.reason), kOrbNoErr);
}

void Report::AddUnfinished(const std::string& destination) {
  unfinished_.push_back(options_.destination + "/" + destination);
}

void Report::AddShortage(const Shortage& shortage) {
  isShort_ = true;
  err_ << "orb-import: kOrbErrDiskFull " << Quote(shortage.folder) << ": "
       << FormatBytes(shortage.needed) << " to copy, and room for "
       << FormatBytes(shortage.available) << (options_.dryRun ? "" : "; nothing was copied")
       << ". --fill copies what fits.\n"
       << std::flush;
  if (!options_.json) return;
  JsonLine line;
  line.Text("status", "failed").Path("destination", shortage.folder);
  line.Number("bytes", shortage.needed).Number("room", shortage.available);
  line.Text("code", CodeName(kOrbErrDiskFull)).Text("reason", CodeMeaning(kOrbErrDiskFull));
  out_ << line.Finished() << std::flush;
}

std::uint64_t Report::Copied() const {
  std::uint64_t copied = 0;
  for (const auto& [type, tally] : tallies_) copied += tally.copied;
  return copied;
}

void Report::PrintItem(const char* status,
                       const Item& item,
                       const std::string& destination,
                       OrbResult code) {
  if (options_.json) {
    JsonLine line;
    line.Text("status", status).Path("source", options_.source + "/" + item.path);
    if (!destination.empty()) line.Path("destination", options_.destination + "/" + destination);
    line.Text("type", TypeName(item.type)).Number("bytes", item.size);
    line.Text("modified", UtcText(item.modified));
    if (code >= kOrbErrFirst) line.Text("code", CodeName(code)).Text("reason", CodeMeaning(code));
    out_ << line.Finished() << std::flush;
    return;
  }
  out_ << std::left << std::setw(8) << status << ' ' << Quote(item.path);
  if (!destination.empty()) out_ << " -> " << Quote(destination);
  if (code >= kOrbErrFirst) out_ << " (" << CodeName(code) << ")";
  out_ << '\n' << std::flush;
}

void Report::PrintOther(const char* status,
                        const std::string& path,
                        const char* reason,
                        OrbResult code) {
  if (options_.json) {
    JsonLine line;
    line.Text("status", status).Path("source", options_.source + "/" + path);
    if (code >= kOrbErrFirst) line.Text("code", CodeName(code));
    line.Text("reason", reason != nullptr ? reason : CodeMeaning(code));
    out_ << line.Finished() << std::flush;
    return;
  }
  out_ << std::left << std::setw(8) << status << ' ' << Quote(path) << " ("
       << (reason != nullptr ? reason : CodeName(code)) << ")\n"
       << std::flush;
}

void Report::Close(bool interrupted) {
  PrintProblems();
  if (options_.quiet) return;
  std::ostream& to = options_.json ? err_ : out_;
  PrintPlaces(to);
  PrintTable(to);
  PrintSkips(to);
  PrintSafety(to);
  if (interrupted) to << "Stopped before the end. The same command goes on from here.\n";
  to << std::flush;
}

void Report::PrintProblems() {
  for (const Failed& failed : failures_) {
    err_ << "orb-import: " << CodeName(failed.code) << " " << Quote(failed.path) << ": "
         << CodeMeaning(failed.code) << '\n';
  }
  for (const std::string& path : unfinished_) {
    err_ << "orb-import: unfinished until its card is imported again: " << Quote(path) << '\n';
  }
  if (!options_.quiet) {
    for (const std::string& path : links_) {
      err_ << "orb-import: link, not followed: " << Quote(path) << '\n';
    }
  }
  err_ << std::flush;
}

void Report::PrintPlaces(std::ostream& to) const {
  const auto drive = [](const std::string& folder) {
    return DriveText(COrbFileHandle(OrbPath(folder)).GetDriveType());
  };
  to << "From " << Quote(options_.source) << ", " << drive(options_.source) << "\nTo   "
     << Quote(options_.destination) << ", " << drive(NearestFolder(options_.destination)) << '\n';
}

void Report::PrintTable(std::ostream& to) const {
  const auto row = [&](const std::string& name, const Tally& tally) {
    to << std::left << std::setw(8) << name << std::right << std::setw(8) << tally.copied
       << std::setw(12) << FormatBytes(tally.copiedBytes) << std::setw(9) << tally.present
       << std::setw(8) << tally.failed << '\n';
  };
  to << std::left << std::setw(8) << "Type" << std::right << std::setw(8)
     << (options_.dryRun ? "To copy" : "Copied") << std::setw(12) << "Size" << std::setw(9)
     << "Present" << std::setw(8) << "Failed" << '\n';
  Tally sum;
  for (const auto& [type, tally] : tallies_) {
    row(TypeName(type), tally);
    sum.copied += tally.copied;
    sum.copiedBytes += tally.copiedBytes;
    sum.present += tally.present;
    sum.failed += tally.failed;
  }
  row("All", sum);
}

void Report::PrintSkips(std::ostream& to) const {
  constexpr struct {
    SkipReason reason;
    const char* what;
  } kReasons[] = {{SkipReason::kLink, "link"},
                  {SkipReason::kHidden, "hidden item"},
                  {SkipReason::kSpecial, "special file"},
                  {SkipReason::kUnknownType, "other file"}};
  std::string text;
  for (const auto& [reason, what] : kReasons) {
    const auto found = skips_.find(reason);
    if (found == skips_.end()) continue;
    text += (text.empty() ? "" : ", ") + Counted(found->second, what);
  }
  if (!text.empty()) to << "Passed over: " << text << '\n';
}

void Report::PrintSafety(std::ostream& to) const {
  if (verified_ > 0) to << "Read back and found equal: " << Counted(verified_, "file") << '\n';
  if (trashed_ > 0) {
    to << "Put into the trash: " << Counted(trashed_, "file") << ", " << FormatBytes(trashedBytes_)
       << ", whose room is free when the trash is emptied\n";
  }
  if (kept_ > 0) to << "Imported, but left in SOURCE: " << Counted(kept_, "file") << '\n';
}

}  // namespace orbimport
