#include "UtilsRapidXml/MessageList.h"

namespace UtilsRapidXml {

void VMessageList::Add(const std::string& text)
{
    if (!HasRoom()) {
        ++lost;
        return;
    }
    texts.push_back(text);
    size += text.size() + sizeof(std::string);
}

void VMessageList::AppendTo(std::vector<std::string>& messages) const
{
    messages.insert(messages.end(), texts.begin(), texts.end());
    if (lost > 0) {
        messages.push_back("And " + std::to_string(lost) + " more messages of this kind");
    }
}

} // namespace UtilsRapidXml
