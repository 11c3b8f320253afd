#pragma once

#include "UtilsRapidXml/IVersion.h"
#include "UtilsRapidXml/RapidXml.h"

#include <string>
#include <vector>

class IDataVerifyReader;
class IDataVerifyWriter;

/// The items of a store as a configuration file, and back.
///
/// A file carries paths, schemas and both values. Of the flags it carries only VerifyRequired, by
/// the presence of a proposed value. The caller holds the view, so that what a load does commits as
/// one change. See `DataStoreFileFormat` for the parts of a document. Threads: the one of the view.
/// Failure: every problem is a message, and the next element goes on, so that one load reports
/// everything; what was read before an error stays.
namespace DataStoreFileIO {

/// Reads a document into a store. Warnings go to the log category "DataStore" at level 3, then
/// errors at level 2.
///
/// @return true if there was no error
bool ReadConfiguration(const rapidxml::xml_document<char>& document, IDataVerifyWriter& writer);

/// As above, but the messages are appended to lists and nothing is logged.
bool ReadConfiguration(const rapidxml::xml_document<char>& document, IDataVerifyWriter& writer,
                       std::vector<std::string>& errors, std::vector<std::string>& warnings);

/// Writes a store into an empty document. Messages go to the log category "DataStore" at level 2.
///
/// Deliberate: an empty store gives a file that is refused on reading, since there must be a node.
/// @return true if there was no message
bool WriteConfiguration(const IDataVerifyReader& reader, rapidxml::xml_document<char>& document);

/// As above, but the messages are appended to a list and nothing is logged.
///
/// @param version  an unset one cannot be written, which is a message
bool WriteConfiguration(const IDataVerifyReader& reader, rapidxml::xml_document<char>& document,
                        const UtilsRapidXml::IVersion& version, std::vector<std::string>& errors);

} // namespace DataStoreFileIO
