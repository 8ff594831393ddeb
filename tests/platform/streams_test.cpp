// SPDX-License-Identifier: MIT
#include "platform/streams.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include "platform/items.h"
#include "support/temp_folder.h"

namespace {

namespace fs = std::filesystem;
using orb::platform::InputStream;
using orb::platform::Items;
using orb::platform::kItemExists;
using orb::platform::kNoSuchItem;
using orb::platform::kNotPermitted;
using orb::platform::OutputStream;
using orb::test::ReadAll;
using orb::test::TempFolder;

TEST(OutputStream, TakesNoNameThatSomebodyElseTookMeanwhile) {
  const TempFolder folder;
  auto stream = OutputStream::Append(folder / "new");
  ASSERT_TRUE(stream);
  folder.Write("new", "theirs");
  EXPECT_EQ(stream.Value().Finish().Reason(), kItemExists);
  EXPECT_EQ(ReadAll(folder / "new"), "theirs");
}

TEST(Streams, OpenRegularFilesOnly) {
  const TempFolder folder;
  folder.Write("file", "x");
  fs::create_directory(folder / "locked");
  folder.Write("locked/file", "x");
  fs::create_symlink("file", folder / "link");
  fs::create_symlink("nowhere", folder / "dangling");
  ASSERT_EQ(::mkfifo((folder / "pipe").c_str(), 0600), 0);
  ASSERT_TRUE(Items::Current().SetLocked(folder / "locked/file", true));
  ASSERT_TRUE(Items::Current().SetLocked(folder / "locked", true));
  for (const char* name : {"pipe", "link", "dangling", "locked/file", "locked/new"}) {
    const auto stream = OutputStream::Append(folder / name);
    ASSERT_FALSE(stream) << name;
    EXPECT_EQ(stream.Reason(), kNotPermitted) << name;
  }
  EXPECT_EQ(InputStream::Open(folder / "pipe").Reason(), kNotPermitted);
  EXPECT_EQ(InputStream::Open(folder / "dangling").Reason(), kNoSuchItem);
  EXPECT_EQ(OutputStream::Append(folder / "missing/file").Reason(), kNoSuchItem);

  const auto source = InputStream::Open(folder / "link");
  ASSERT_TRUE(source);
  EXPECT_TRUE(OutputStream::Append(folder / "file").Value().Writes(source.Value()));
  EXPECT_FALSE(OutputStream::Append(folder / "new").Value().Writes(source.Value()));
}

}  // namespace
