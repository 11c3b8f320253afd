#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/IMessageParser.h"
#include "UtilsRapidXml/RapidXml.h"

#include <memory>
#include <string>
#include <string_view>

namespace ControlStreamServer {

/// What all parsers have in common: reading the text, and finding the element that they look for.
///
/// Names are compared exactly, and what nobody looks for is ignored, every attribute included.
/// Threads: Parse [socket]; keeps no state between messages.
/// Failure: a text that is not XML, lacks the element or a required value is not taken.
class VMessageParser : public IMessageParser
{
public:
    bool Parse(std::shared_ptr<IClientConnection> connection, std::wstring message,
               bool translateEntities) final;

protected:
    using VElement = rapidxml::xml_node<wchar_t>;

    /// @param rootName  of the element that the parser looks for; outlives the parser
    explicit VMessageParser(std::wstring_view rootName) : rootName(rootName) {}

    /// Answers the request that lies in `root`.
    ///
    /// @return false, with nothing done, where a required value is missing or empty
    virtual bool Answer(const std::shared_ptr<IClientConnection>& connection,
                        const VElement& root) = 0;

    /// Returns the first element of that name below `parent`, or null.
    static const VElement* FindChild(const VElement& parent, std::wstring_view name);

    /// Returns the text of an element: its first run of characters that are not all white space.
    /// CDATA is no text.
    ///
    /// Deliberate: unless entities are translated, the text is taken as it stands. A Correlation of
    /// "a&amp;b" is seven characters, and devices get it back as "a&amp;amp;b".
    static std::wstring ValueOf(const VElement& element);

    /// Returns the text of the first child of that name; without one, the empty text.
    static std::wstring ChildValue(const VElement& parent, std::wstring_view name);

private:
    const std::wstring_view rootName;
};

} // namespace ControlStreamServer
