#pragma once

#include "UtilsRapidXml/IVersion.h"
#include "UtilsRapidXml/RapidXml.h"

#include <boost/function.hpp>

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace UtilsRapidXml {

/// An element that is written. The version of the file decides which attributes are left out.
///
/// Owns: a share of what the nodes of one file have in common; the element and all texts lie in the
/// memory of the document, which must outlive it. Threads: one, the writer's. Failure: an empty
/// callback throws as `INode` tells.
class VWriterNode
{
public:
    using ChildCallback = boost::function<void(VWriterNode&)>;

    /// Makes the root of a file, whose declaration it appends to the document.
    VWriterNode(rapidxml::xml_document<char>& document, const IVersion& version);

    VWriterNode(const VWriterNode&) = delete;
    VWriterNode& operator=(const VWriterNode&) = delete;

    /// Appends an attribute with copies of both texts.
    ///
    /// @return false where the file's version leaves it out, without a message
    bool WriteAttribute(std::string_view name, std::string_view value, const IVersion& first,
                        const IVersion& last);

    /// Appends an element as the last child and hands it to the callback.
    void AddChildElement(std::string_view name, const ChildCallback& callback);

    void AddError(const std::string& text);

    /// Appends all errors of the file so far.
    void GetErrors(std::vector<std::string>& errors) const;

private:
    /// What all nodes of one file share.
    struct VGlobalInfo
    {
        IVersion Version;
        std::vector<std::string> Errors;
    };

    VWriterNode(rapidxml::xml_node<char>& element, rapidxml::xml_document<char>& document,
                std::shared_ptr<VGlobalInfo> global);

    void AppendAttribute(rapidxml::xml_node<char>& to, std::string_view name,
                         std::string_view value);

    rapidxml::xml_node<char>& element;
    rapidxml::xml_document<char>& document; // whose memory everything lies in
    std::shared_ptr<VGlobalInfo> global;
};

} // namespace UtilsRapidXml
