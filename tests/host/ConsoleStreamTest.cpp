#include "ConsoleStream.h"

#include "Console.h"
#include "MainThreadWakeUp.h"
#include "support/LogCapture.h"

#include <QCoreApplication>
#include <gmock/gmock.h>

#include <csignal>
#include <memory>
#include <stdexcept>
#include <string>
#include <sys/ioctl.h>
#include <thread>
#include <unistd.h>
#include <utility>

using QuorixHost::VConsole;
using QuorixHost::VConsoleLine;
using QuorixHost::VConsoleStream;

namespace {

/// A console between two pipes, with an event loop that the test turns.
class ConsoleStream : public testing::Test
{
protected:
    ConsoleStream()
    {
        if (pipe(input) != 0 || pipe(output) != 0) {
            throw std::runtime_error("no pipe");
        }
        console.AddCommand("say", [](VConsoleLine& line) { return line.TakeRest(); });
        stream = std::make_unique<VConsoleStream>(console, input[0], output[1]);
    }

    ~ConsoleStream() override
    {
        stream.reset();
        for (const int descriptor : {input[0], input[1], output[0], output[1]}) {
            close(descriptor);
        }
    }

    void Write(const std::string& text)
    {
        ASSERT_EQ(static_cast<ssize_t>(text.size()), write(input[1], text.data(), text.size()));
    }

    /// Turns the loop until so many bytes of answers are there. @return the answers
    std::string Read(std::size_t size)
    {
        std::string text;
        while (text.size() < size) {
            QCoreApplication::processEvents();
            char bytes[65536];
            int waiting = 0;
            ioctl(output[0], FIONREAD, &waiting);
            if (waiting > 0) {
                const ssize_t count = read(output[0], bytes, sizeof bytes);
                text.append(bytes, static_cast<std::size_t>(count));
            }
        }
        return text;
    }

    int argumentCount = 1;
    char name[5] = "test";
    char* arguments[2] = {name, nullptr};
    QCoreApplication application{argumentCount, arguments};
    int input[2] = {-1, -1};
    int output[2] = {-1, -1};
    VConsole console;
    std::unique_ptr<VConsoleStream> stream;
};

} // namespace

TEST_F(ConsoleStream, AnswersEachLineWithOneLine)
{
    Write("say 1\nbogus\n\nsay 2\r\n");

    const std::string expected = "ok 1\nerror: unknown command 'bogus'\nerror: expected a command\n"
                                 "ok 2\n";
    EXPECT_EQ(expected, Read(expected.size()));
}

TEST_F(ConsoleStream, PutsALineTogetherFromItsPieces)
{
    Write("sa");
    QCoreApplication::processEvents();
    Write("y x");
    QCoreApplication::processEvents();
    Write("\n");

    EXPECT_EQ("ok x\n", Read(5));
}

TEST_F(ConsoleStream, TakesTheLongestLineAndRefusesALongerOne)
{
    const std::string longest = "say " + std::string(VConsoleStream::maximumLineBytes - 4, 'x');
    std::thread writer([&] {
        for (const std::string& line : {longest + "\n", longest + "x\n", std::string("say y\n")}) {
            for (std::size_t sent = 0; sent < line.size();) {
                const ssize_t count = write(input[1], line.data() + sent, line.size() - sent);
                if (count < 0) {
                    return;
                }
                sent += static_cast<std::size_t>(count);
            }
        }
    });
    QuorixHost::VMainThreadWakeUp quit(&QCoreApplication::quit);
    std::string answers;
    std::thread reader([&] {
        char bytes[65536];
        while (answers.find("ok y\n") == std::string::npos) {
            const ssize_t count = read(output[0], bytes, sizeof bytes);
            if (count <= 0) {
                break;
            }
            answers.append(bytes, static_cast<std::size_t>(count));
        }
        quit.Wake();
    });

    QCoreApplication::exec();
    writer.join();
    reader.join();

    EXPECT_EQ("ok " + longest.substr(4) + "\n" +
                  "error: the line is longer than 1048576 bytes\nok y\n",
              answers);
}

TEST_F(ConsoleStream, ALastLineNeedsNoLineFeedAndTheEndIsLogged)
{
    TestSupport::VLogCapture log;
    Write("say last");
    close(std::exchange(input[1], -1));

    EXPECT_EQ("ok last\n", Read(8));
    QCoreApplication::processEvents();
    EXPECT_THAT(log.Texts("Host"),
                testing::ElementsAre("The console's input has ended; the host goes on"));
}

TEST_F(ConsoleStream, TakesNoLineBehindItsEnd)
{
    console.AddCommand("end", [this](VConsoleLine&) {
        stream->End();
        return std::string();
    });
    Write("end\nsay more\n");

    EXPECT_EQ("ok\n", Read(3));
    Write("say still more\n");
    for (int i = 0; i < 10; ++i) {
        QCoreApplication::processEvents();
    }
    int waiting = 0;
    ioctl(output[0], FIONREAD, &waiting);
    EXPECT_EQ(0, waiting);
}

TEST_F(ConsoleStream, EndsWhenNobodyTakesTheAnswers)
{
    std::signal(SIGPIPE, SIG_IGN);
    TestSupport::VLogCapture log;
    close(std::exchange(output[0], -1));
    Write("say 1\nsay 2\n");

    while (log.Messages().empty()) {
        QCoreApplication::processEvents();
    }

    EXPECT_THAT(log.Texts("Host"),
                testing::ElementsAre("The console's answers cannot be written: Broken pipe"));
}

TEST_F(ConsoleStream, DoesNotBeginALineWhileACommandSpinsALoop)
{
    console.AddCommand("spin", [this](VConsoleLine&) {
        Write("say after\n");
        for (int i = 0; i < 10; ++i) {
            QCoreApplication::processEvents();
        }
        return std::string("spun");
    });
    Write("spin\n");

    EXPECT_EQ("ok spun\nok after\n", Read(17));
}
