#include "ConsoleStream.h"

#include "Console.h"
#include "utils/LogStatement.h"

#include <QSocketNotifier>

#include <array>
#include <cerrno>
#include <cstring>
#include <poll.h>
#include <unistd.h>

namespace QuorixHost {

VConsoleStream::VConsoleStream(VConsole& console, int input, int output)
    : console(console),
      output(output),
      notifier(std::make_unique<QSocketNotifier>(input, QSocketNotifier::Read))
{
    QObject::connect(notifier.get(), &QSocketNotifier::activated, notifier.get(),
                     [this] { OnReadable(); });
}

VConsoleStream::~VConsoleStream() = default;

void VConsoleStream::WriteLine(const std::string& line)
{
    const std::string text = line + '\n';
    for (std::size_t written = 0; written < text.size();) {
        const ssize_t count = write(output, text.data() + written, text.size() - written);
        if (count >= 0) {
            written += static_cast<std::size_t>(count);
        } else if (errno == EAGAIN) { // a terminal that another program set so
            pollfd writable = {output, POLLOUT, 0};
            poll(&writable, 1, -1);
        } else if (errno != EINTR) {
            KVR_LOG("Host", 3, "The console's answers cannot be written: %1%",
                    std::strerror(errno));
            End();
            return;
        }
    }
}

void VConsoleStream::End()
{
    ended = true;
    notifier->setEnabled(false);
}

void VConsoleStream::OnReadable()
{
    std::array<char, 65536> bytes;
    const ssize_t count = read(static_cast<int>(notifier->socket()), bytes.data(), bytes.size());
    if (count < 0 && (errno == EINTR || errno == EAGAIN)) {
        return;
    }

    notifier->setEnabled(false); // a command may spin a loop of its own
    if (count > 0) {
        lines.Append(bytes.data(), static_cast<std::size_t>(count));
        for (auto line = lines.TakeLine(); line && !ended; line = lines.TakeLine()) {
            AnswerLine(*line);
        }
    } else if (const auto line = lines.TakeLastLine()) {
        AnswerLine(*line);
    }
    if (count <= 0 && !ended) {
        KVR_LOG("Host", 4, "The console's input has ended; the host goes on");
        ended = true;
    }
    notifier->setEnabled(!ended);
}

void VConsoleStream::AnswerLine(const VLineBuffer::VLine& line)
{
    WriteLine(line.tooLong
                  ? "error: the line is longer than " + std::to_string(maximumLineBytes) + " bytes"
                  : console.Answer(line.text));
}

} // namespace QuorixHost
