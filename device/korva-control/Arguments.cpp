#include "korva-control/Arguments.h"

#include <algorithm>
#include <charconv>

#include <CLI/CLI.hpp>

namespace {

// No text that is sent can hold it, and a word that begins with it is marked once more.
constexpr char Mark = '\x1F';

bool IsNotation(const std::string& word)
{
    return word == "++" || (!word.empty() && (word[0] == '[' || word[0] == Mark));
}

} // namespace

std::vector<std::string> ProtectArguments(int argc, const char* const* argv)
{
    std::vector<std::string> words;
    bool plain = false;
    for (int i = 1; i < argc; ++i) {
        const std::string word = argv[i];
        if (!plain && word == "--") {
            plain = true;
            continue;
        }
        const bool marked = IsNotation(word) || (plain && !word.empty() && word[0] == '-');
        words.push_back(marked ? Mark + word : word);
    }
    return words;
}

std::string PlainWord(std::string word)
{
    if (!word.empty() && word[0] == Mark) {
        word.erase(0, 1);
    }
    return word;
}

std::string PlainMessage(std::string message)
{
    message.erase(std::remove(message.begin(), message.end(), Mark), message.end());
    return message;
}

CLI::Validator WholeNumber(std::uint64_t least, std::uint64_t greatest)
{
    const auto check = [least, greatest](std::string& text) {
        std::uint64_t number = 0;
        const char* const end = text.data() + text.size();
        const auto read = std::from_chars(text.data(), end, number);
        if (read.ec != std::errc() || read.ptr != end || number < least || number > greatest) {
            return "\"" + text + "\" is no whole number from " + std::to_string(least) + " to " +
                   std::to_string(greatest);
        }
        text = std::to_string(number);
        return std::string();
    };
    return CLI::Validator(check, std::string());
}

std::function<std::string(const std::string&)> CheckNumber(int greatest)
{
    return [greatest](const std::string& text) {
        double number = 0;
        // Comparisons with what is not a number are false.
        const bool good =
            CLI::detail::lexical_cast(text, number) && number >= 0 && number <= greatest;
        return good ? std::string()
                    : "\"" + text + "\" is no number from 0 to " + std::to_string(greatest);
    };
}
