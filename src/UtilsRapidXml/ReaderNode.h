#pragma once

#include "UtilsRapidXml/INode.h"
#include "UtilsRapidXml/MessageList.h"
#include "UtilsRapidXml/RapidXml.h"

#include <functional>
#include <memory>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace UtilsRapidXml {

/// An element that is read.
///
/// When it goes it warns of every child and attribute that nobody asked for, once for each name.
/// The errors and warnings of the file are read from the root once the last callback has returned.
/// Owns: a share of what the nodes of one file have in common; the element is the document's, which
/// must outlive it. Threads and failure: as `INode` tells.
class VReaderNode : public INode
{
public:
    /// Makes the root, from the document or from an element.
    ///
    /// @param strictSequence  whether children must come in the order of their declarations
    VReaderNode(const rapidxml::xml_node<char>& element, bool strictSequence);

    ~VReaderNode() override;

    VReaderNode(const VReaderNode&) = delete;
    VReaderNode& operator=(const VReaderNode&) = delete;

    std::string GetName() const override;
    void SetVersion(const IVersion& version) override;
    IVersion GetVersion() const override;
    void WriterHook() override;
    void AddChildElement(const std::string& name, const std::string& typeName, std::int32_t minimum,
                         std::int32_t maximum, const IVersion& first,
                         const IVersion& last) override;
    void ProcessChildren(ChildCallback callback, bool choice) override;
    bool ReadAttribute(const std::string& name, std::string& value, const std::string& typeName,
                       bool required, const IVersion& first, const IVersion& last) override;
    void AddError(const std::string& text) override;
    void AddWarning(const std::string& text) override;
    std::size_t GetErrorCount() const override;

    /// Appends all messages of the file so far.
    void GetErrors(std::vector<std::string>& errors) const;
    void GetWarnings(std::vector<std::string>& warnings) const;

    /// Returns whether a further error would be kept. One that is not kept counts all the same, so
    /// that a loader may save itself the trouble of making its text.
    bool HasRoomForErrors() const;

private:
    struct VChildRule
    {
        std::string Name;
        std::string TypeName;
        std::int32_t Minimum;
        std::int32_t Maximum;
        IVersion First;
        IVersion Last;
    };

    /// What all nodes of one file share.
    struct VGlobalInfo
    {
        IVersion Version;
        VMessageList Errors;
        VMessageList Warnings;
        bool StrictSequence = false;
        std::set<std::string> IDs;
    };

    /// A child that is to be visited.
    struct VAcceptedChild
    {
        std::uint64_t Index; ///< among the child elements
        const rapidxml::xml_node<char>* Element;
    };

    class VChildCheck;

    VReaderNode(const rapidxml::xml_node<char>& element, std::shared_ptr<VGlobalInfo> global,
                const std::string& parentPath);

    template <typename... Args>
    void Error(const char* format, const Args&... args);
    template <typename... Args>
    void Warn(const char* format, const Args&... args);

    std::string PathOf(std::string_view child) const;
    void CheckIdentifier(const std::string& value, const std::string& typeName);
    void ReportUnknown();

    const rapidxml::xml_node<char>& element; // not owned
    std::vector<VChildRule> childRules;
    std::shared_ptr<VGlobalInfo> global;
    std::string path;
    std::uint64_t lastChildIndex = 0; // the highest index accepted so far
    std::set<std::string, std::less<>> knownElements;
    std::set<std::string, std::less<>> knownAttributes;
};

} // namespace UtilsRapidXml
