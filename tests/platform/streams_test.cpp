// SPDX-License-Identifier: MIT
#include "platform/streams.h"

#include <chrono>
#include <thread>

#include "platform/copier.h"
#include "platform/file_handle.h"
#include "platform/file_writer.h"
#include "support/files.h"

namespace orb::platform {
namespace {

using namespace test;

TEST(OutputStream, TakesNoNameThatSomebodyElseTookMeanwhile) {
  const Tree tree;
  auto stream = OutputStream::Append(tree / "new");
  ASSERT_TRUE(stream);
  tree.Make("new=theirs");
  EXPECT_EQ(ErrorOf(stream.Value().Finish()), kItemExists);
  EXPECT_EQ(tree.Read("new"), "theirs");
}

// As a file server takes one: whoever opens the file waits until it lets go.
TEST(Streams, WaitForAFileThatIsLeased) {
  const Tree tree("photo");
  const auto lease = [&](auto use) {
    const int file = ::open((tree / "photo").c_str(), O_RDWR | O_CLOEXEC);
    ASSERT_EQ(::fcntl(file, F_SETLEASE, F_WRLCK), 0);
    std::thread server([&] {
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
      ::close(file);
    });
    use();
    server.join();
  };
  const auto body = [&] {
    lease([&] { EXPECT_TRUE(InputStream::Open(tree / "photo")); });
    lease([&] { EXPECT_TRUE(OutputStream::Append(tree / "photo")); });
    lease([&] { EXPECT_TRUE(FileHandle::OpenForReading(tree / "photo")); });
    lease([&] { EXPECT_TRUE(FileHandle::OpenForWriting(tree / "photo")); });
    lease([&] { EXPECT_TRUE(FileWriter::Open(tree / "photo")); });
    lease([&] { EXPECT_TRUE(CopyItem(tree / "photo", tree / "copy")); });
  };
  ORB_IN_CHILD(RunInChild([] { return ::signal(SIGIO, SIG_IGN) != SIG_ERR; }, body));
}

}  // namespace
}  // namespace orb::platform
