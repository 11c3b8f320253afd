#include "DPI/DPIUtils.h"

#include <QGuiApplication>
#include <QScreen>

#include <algorithm>
#include <cmath>
#include <limits>

namespace {

// What a display is taken to have where nothing is scaled.
constexpr double referenceDotsPerInch = 96.0;

int RoundToPixels(double length)
{
    constexpr double least = std::numeric_limits<int>::min();
    constexpr double greatest = std::numeric_limits<int>::max();
    return static_cast<int>(std::clamp(std::round(length), least, greatest));
}

} // namespace

int DPIUtils::Scale(int length)
{
    // A screen is only asked for under a living GUI application: Qt has none without it.
    if (qobject_cast<QGuiApplication*>(QCoreApplication::instance()) == nullptr) {
        return length;
    }
    const QScreen* screen = QGuiApplication::primaryScreen();
    if (screen == nullptr) {
        return length;
    }
    return RoundToPixels(length * screen->logicalDotsPerInch() / referenceDotsPerInch);
}
