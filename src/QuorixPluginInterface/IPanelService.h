#pragma once

#include <boost/function.hpp>

#include <string>

class QWidget;

/// The host's panels. Threads: the GUI thread.
class IPanelService
{
public:
    virtual ~IPanelService() = default;

    /// Keeps a factory under a name. It may return null once what it shows has gone.
    virtual void RegisterPanel(const std::string& name, boost::function<QWidget*()> factory) = 0;

    /// Shows a widget, which deletes itself when it is closed.
    virtual void ShowPanel(const std::string& name, QWidget* widget) = 0;
};
