#pragma once

#include "UtilsRapidXml/ParseXml.h"
#include "UtilsRapidXml/ReaderNode.h"

#include <boost/bind/bind.hpp>
#include <gtest/gtest.h>

#include <functional>

// What tests of loading share: a document is a text, and its loader a function of the element R.

namespace Loading {

using UtilsRapidXml::INode;
using UtilsRapidXml::IVersion;

using Texts = std::vector<std::string>;
using Loader = std::function<void(INode&)>;

const IVersion unset;
const IVersion v1{1, 0};
const IVersion v2{2, 0};
const IVersion v3{3, 0};

/// What loading a document has found.
struct VFound
{
    Texts Errors;
    Texts Warnings;
};

/// Has the loader read the element R of a document.
inline VFound Load(std::string text, const Loader& loader, bool strictSequence = false)
{
    rapidxml::xml_document<char> document;
    EXPECT_TRUE(UtilsRapidXml::ParseXml<0>(document, text.data()));
    UtilsRapidXml::VReaderNode root(document, strictSequence);
    root.AddChildElement("R", "", 0, 0, unset, unset);
    root.ProcessChildren(boost::bind(loader, boost::placeholders::_1), false);
    VFound found;
    root.GetErrors(found.Errors);
    root.GetWarnings(found.Warnings);
    return found;
}

inline void Declare(INode& node, const std::string& name, int minimum = 0, int maximum = 0,
                    const IVersion& first = unset, const IVersion& last = unset)
{
    node.AddChildElement(name, name + "Type", minimum, maximum, first, last);
}

inline void AppendName(Texts& names, INode& node)
{
    names.push_back(node.GetName());
}

/// Processes the children. @return the names of those that were visited, in order
inline Texts Visit(INode& node, bool choice = false)
{
    Texts names;
    node.ProcessChildren(boost::bind(&AppendName, boost::ref(names), boost::placeholders::_1),
                         choice);
    return names;
}

inline bool Read(INode& node, const std::string& name, std::string& value, bool required = false,
                 const IVersion& first = unset, const IVersion& last = unset)
{
    return node.ReadAttribute(name, value, "xsd:string", required, first, last);
}

} // namespace Loading
