#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace CLI {
class Validator;
}

// The parser of the command line reads some words as a notation of its own: "++" ends a command,
// "[a,b]" is a list of two, and behind "--" a word is only plain where the command wants more. Here
// every word stands for itself, since any text may be the name of a command or a parameter.

/// Returns the program's arguments for the parser, with such words marked, and everything behind
/// "--" marked plain.
std::vector<std::string> ProtectArguments(int argc, const char* const* argv);

/// Takes the mark from a word; to be applied to every text that an option or argument receives.
std::string PlainWord(std::string word);

/// Takes all marks from a message of the parser.
std::string PlainMessage(std::string message);

/// Returns a check that admits whole numbers in decimal, from `least` to `greatest`; to be given to
/// an option as a transformation. The parser by itself would take a negative number for a very
/// great one, one that is too great for the greatest there is, and "010" for eight.
CLI::Validator WholeNumber(std::uint64_t least, std::uint64_t greatest);

/// Returns a check that says what is wrong with a text that should be a number from 0 on. The
/// parser's own lets pass what is not a number, since that is neither below nor above anything.
std::function<std::string(const std::string&)> CheckNumber(int greatest);
