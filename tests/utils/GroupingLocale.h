#pragma once

#include <locale>
#include <string>

/// Makes the global C++ locale one that groups digits and has a decimal comma, for its own
/// lifetime: as a host does on a desktop of much of the world.
class VGroupingLocale
{
public:
    VGroupingLocale() : previous(std::locale::global(std::locale(std::locale(), new VPunctuation)))
    {
    }
    ~VGroupingLocale() { std::locale::global(previous); }

    VGroupingLocale(const VGroupingLocale&) = delete;
    VGroupingLocale& operator=(const VGroupingLocale&) = delete;

private:
    class VPunctuation : public std::numpunct<char>
    {
    protected:
        char do_thousands_sep() const override { return '.'; }
        char do_decimal_point() const override { return ','; }
        std::string do_grouping() const override { return "\3"; }
        std::string do_truename() const override { return "wahr"; }
    };

    const std::locale previous;
};
