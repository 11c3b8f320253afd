#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace UtilsRapidXml {

/// The errors, or the warnings, of one file. Every message counts, but a file that is nothing but
/// faults cannot fill the memory with them: beyond a size they are counted only.
class VMessageList
{
public:
    /// How much text is kept. A message that is longer than what is left is still kept whole.
    static constexpr std::size_t GreatestSize = std::size_t(16) << 20;

    /// Returns whether a message would be kept, so that nobody makes one in vain.
    bool HasRoom() const { return size < GreatestSize; }

    void Add(const std::string& text);

    std::size_t Count() const { return texts.size() + lost; }

    /// Appends all messages, and how many there were beside those that were kept.
    void AppendTo(std::vector<std::string>& messages) const;

private:
    std::vector<std::string> texts;
    std::size_t size = 0;
    std::size_t lost = 0;
};

} // namespace UtilsRapidXml
