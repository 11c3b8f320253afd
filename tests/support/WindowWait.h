#pragma once

#include <QTest>
#include <QWidget>

#include <functional>

namespace TestSupport {

/// How long a window may take for anything, in milliseconds. Only a fault waits for it.
constexpr int windowLimit = 60'000;

/// Lets the event loop turn until a condition holds. @return false when it never does
inline bool WaitFor(const std::function<bool()>& condition)
{
    return QTest::qWaitFor(condition, windowLimit);
}

/// Waits until a window has come up and has the keyboard.
inline bool WaitForActive(QWidget& window)
{
    return QTest::qWaitForWindowActive(&window, windowLimit);
}

} // namespace TestSupport
