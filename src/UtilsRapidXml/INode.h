#pragma once

#include "UtilsRapidXml/IVersion.h"

#include <boost/function.hpp>

#include <cstddef>
#include <cstdint>
#include <string>

namespace UtilsRapidXml {

/// An element of a versioned XML file, as the code that loads the file sees it: it says which
/// attributes and children it knows, and is called back for each child that keeps the rules.
///
/// A loading callback reads attributes, then declares the kinds of child, then processes them; it
/// may declare and process several times. Problems are texts that the whole file shares: a warning
/// is something found and ignored, an error a declared rule that was broken.
/// Threads: one, the loader's. Failure: nothing throws but an empty callback.
class INode
{
public:
    using ChildCallback = boost::function<void(INode&)>;

    /// Returns the element's name, empty if it has none.
    virtual std::string GetName() const = 0;

    /// Sets the version of the file, against which everything is checked from now on.
    virtual void SetVersion(const IVersion& version) = 0;
    virtual IVersion GetVersion() const = 0;

    /// Does nothing on an element that is read.
    virtual void WriterHook() = 0;

    /// Declares one kind of child, for the next ProcessChildren.
    ///
    /// @param minimum  how many there must be; not looked at where children are a choice
    /// @param maximum  how many there may be, below 1 without limit; not looked at in a choice
    virtual void AddChildElement(const std::string& name, const std::string& typeName,
                                 std::int32_t minimum, std::int32_t maximum, const IVersion& first,
                                 const IVersion& last) = 0;

    /// Checks the children against what was declared, and calls back for each that passed, in the
    /// order of the document. Without a declaration nothing happens.
    ///
    /// @param choice  all children must be of one kind, and there must be one
    /// @throws boost::bad_function_call for an empty callback, once there is a child to visit
    virtual void ProcessChildren(ChildCallback callback, bool choice) = 0;

    /// Reads an attribute, which makes it a known one.
    ///
    /// @param typeName  "xsd:ID" and "xsd:IDREF" have their values compared within the file
    /// @return false, with `value` untouched, if it is absent or not supported in the file's
    /// version
    virtual bool ReadAttribute(const std::string& name, std::string& value,
                               const std::string& typeName, bool required, const IVersion& first,
                               const IVersion& last) = 0;

    virtual void AddError(const std::string& text) = 0;
    virtual void AddWarning(const std::string& text) = 0;

    /// Returns how many errors the whole file has had so far.
    virtual std::size_t GetErrorCount() const = 0;

    /// Reports what nobody asked for.
    virtual ~INode() = default;
};

} // namespace UtilsRapidXml
