#include "PortCheck.h"

#include "support/TestListener.h"

#include <gmock/gmock.h>

#include <string>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

using testing::HasSubstr;
using testing::IsEmpty;

namespace {

std::string AdviceOf(const QuorixHost::VPortFinding& finding)
{
    std::string advice;
    for (const std::string& line : finding.advice) {
        advice += line + "\n";
    }
    return advice;
}

/// Another process that holds copies of the test's sockets and does nothing.
class VHolder
{
public:
    VHolder() : pid(fork())
    {
        if (pid == 0) {
            prctl(PR_SET_PDEATHSIG, SIGKILL);
            for (;;) {
                pause();
            }
        }
    }
    ~VHolder()
    {
        kill(pid, SIGKILL);
        waitpid(pid, nullptr, 0);
    }
    VHolder(const VHolder&) = delete;
    VHolder& operator=(const VHolder&) = delete;

    pid_t Pid() const { return pid; }

private:
    const pid_t pid;
};

} // namespace

TEST(PortCheck, AnOwnListenerAnswers)
{
    const TestSupport::VTestListener listener;

    const QuorixHost::VPortFinding finding = QuorixHost::CheckPort(listener.Port());

    EXPECT_TRUE(finding.answers);
    EXPECT_THAT(finding.advice, IsEmpty());
}

TEST(PortCheck, AnotherProcessesListenerIsNamedAlthoughItWouldAnswer)
{
    TestSupport::VTestListener listener;
    const std::uint16_t port = listener.Port();
    const VHolder holder;
    listener.Close();
    ASSERT_NO_THROW(TestSupport::VRawClient client(port)); // a plain connect tells nothing

    const QuorixHost::VPortFinding finding = QuorixHost::CheckPort(port);

    EXPECT_FALSE(finding.answers);
    EXPECT_THAT(AdviceOf(finding), HasSubstr("TCP port " + std::to_string(port) +
                                             " is taken: process " + std::to_string(holder.Pid())));
    EXPECT_THAT(AdviceOf(finding), HasSubstr("listens on 127.0.0.1"));
}

TEST(PortCheck, APortThatIsBoundButNotListenedOnIsTaken)
{
    const TestSupport::VTestListener bound(TestSupport::VTestListener::bindOnly);

    const QuorixHost::VPortFinding finding = QuorixHost::CheckPort(bound.Port());

    EXPECT_FALSE(finding.answers);
    EXPECT_THAT(AdviceOf(finding), HasSubstr("taken by a program that does not listen on it"));
}

TEST(PortCheck, AFreePortThatNobodyListensOnIsTold)
{
    TestSupport::VTestListener listener;
    const std::uint16_t port = listener.Port();
    listener.Close();

    const QuorixHost::VPortFinding finding = QuorixHost::CheckPort(port);

    EXPECT_FALSE(finding.answers);
    EXPECT_THAT(AdviceOf(finding), HasSubstr("although the port is free"));
}
