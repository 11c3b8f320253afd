#include "utils/StandardStreams.h"

#include "support/ChildProcess.h"

#include <cerrno>

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

namespace {

/// Returns the number that the next file gets, with some streams closed before.
int NextDescriptorAfter(bool closesInput, bool closesOutputs)
{
    return TestSupport::RunInChild([&] {
        if (closesInput) {
            close(STDIN_FILENO);
        }
        if (closesOutputs) {
            close(STDOUT_FILENO);
            close(STDERR_FILENO);
        }
        KVR::FillStandardStreams();
        return open("/dev/null", O_RDONLY);
    });
}

TEST(StandardStreams, AreNoPlaceForAFileWhereTheyWereClosed)
{
    const int usual = NextDescriptorAfter(false, false);

    EXPECT_LT(STDERR_FILENO, usual);
    EXPECT_EQ(usual, NextDescriptorAfter(true, false));
    EXPECT_EQ(usual, NextDescriptorAfter(false, true));
    EXPECT_EQ(usual, NextDescriptorAfter(true, true));
}

TEST(StandardStreams, TakeNothingAndGiveNothingWhereTheyWereClosed)
{
    EXPECT_EQ(0, TestSupport::RunInChild([] {
                  char byte = 'x';
                  close(STDIN_FILENO);
                  close(STDOUT_FILENO);
                  KVR::FillStandardStreams();
                  const bool refused = write(STDOUT_FILENO, &byte, 1) < 0 && errno == EBADF;
                  return refused && read(STDIN_FILENO, &byte, 1) == 0 ? 0 : 1;
              }));
}

} // namespace
