// SPDX-License-Identifier: MIT
#include "platform/streams.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <string>
#include <thread>

#include "platform/copier.h"
#include "platform/file_handle.h"
#include "platform/file_writer.h"
#include "support/faults.h"
#include "support/temp_folder.h"

namespace {

using orb::platform::CopyItem;
using orb::platform::FileHandle;
using orb::platform::FileWriter;
using orb::platform::InputStream;
using orb::platform::kItemExists;
using orb::platform::OutputStream;
using orb::test::ReadAll;
using orb::test::RunInChild;
using orb::test::TempFolder;

TEST(OutputStream, TakesNoNameThatSomebodyElseTookMeanwhile) {
  const TempFolder folder;
  auto stream = OutputStream::Append(folder / "new");
  ASSERT_TRUE(stream);
  folder.Write("new", "theirs");
  EXPECT_EQ(stream.Value().Finish().Reason(), kItemExists);
  EXPECT_EQ(ReadAll(folder / "new"), "theirs");
}

// As a file server takes one: whoever opens the file waits until it lets go.
TEST(Streams, WaitForAFileThatIsLeased) {
  const TempFolder folder;
  const std::string photo = folder.Write("photo", "x");
  ORB_IN_CHILD(RunInChild([] { return ::signal(SIGIO, SIG_IGN) != SIG_ERR; },
                          [&] {
                            const auto lease = [&](auto use) {
                              const int file = ::open(photo.c_str(), O_RDWR | O_CLOEXEC);
                              ASSERT_EQ(::fcntl(file, F_SETLEASE, F_WRLCK), 0);
                              std::thread server([&] {
                                std::this_thread::sleep_for(std::chrono::milliseconds(50));
                                ::close(file);
                              });
                              use();
                              server.join();
                            };
                            lease([&] { EXPECT_TRUE(InputStream::Open(photo)); });
                            lease([&] { EXPECT_TRUE(OutputStream::Append(photo)); });
                            lease([&] { EXPECT_TRUE(FileHandle::OpenForReading(photo)); });
                            lease([&] { EXPECT_TRUE(FileHandle::OpenForWriting(photo)); });
                            lease([&] { EXPECT_TRUE(FileWriter::Open(photo)); });
                            lease([&] { EXPECT_TRUE(CopyItem(photo, folder / "copy")); });
                          }));
}

}  // namespace
