// Loads any text as a configuration file, by all that a host and quorix-config do with one. What
// was loaded and could be written must load again without an error, and give the same file.

#include "DocumentEdit.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixDataStore/DataStoreFileIO.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixPreferences/ConfigurationDocument.h"
#include "QuorixPreferences/LegacyAltToSelect.h"
#include "UtilsRapidXml/ParseXml.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

bool Load(std::string text, IDataStore& store, std::vector<std::string>& errors)
{
    rapidxml::xml_document<char> document;
    if (!UtilsRapidXml::ParseXml<0>(document, text.data())) {
        Require(document.first_node() == nullptr, "a text that is no XML gives no document");
        return false;
    }
    static_cast<void>(FindLegacyAltToSelect(document));
    std::vector<std::string> warnings;
    VDataVerifyWriter writer(store);
    const bool good = DataStoreFileIO::ReadConfiguration(document, writer, errors, warnings);
    Require(good == errors.empty(), "a load is good if it has no errors");
    return true;
}

std::string Save(const IDataStore& store, std::vector<std::string>& errors)
{
    const VDataVerifyReader reader(store);
    rapidxml::xml_document<char> document;
    const bool good = DataStoreFileIO::WriteConfiguration(
        reader, document, DataStoreFileFormat::CurrentVersion, errors);
    Require(good == errors.empty(), "a save is good if it has no errors");
    return PrintDocument(document);
}

bool Holds(const std::string& text, const char* part)
{
    return text.find(part) != std::string::npos;
}

/// Whether a file carries everything: the last digits of real numbers and the tabs in the names of
/// a schema it does not, and one without a node is refused.
bool IsCarried(const std::string& text)
{
    return !Holds(text, "Float") && !Holds(text, "\\t") && Holds(text, "<Node");
}

void EditByText(const std::string& text)
{
    try {
        QuorixConfig::VDocumentEdit edit(text);
        edit.SetAttribute("A.B", DataStoreFileFormat::Verified.Name, "1");
        static_cast<void>(edit.Print());
    } catch (const std::runtime_error&) {
        // What is parsed with its comments may be wrong where it is not without them.
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    VDataStore store;
    std::vector<std::string> errors;
    if (!Load(text, store, errors)) {
        return 0;
    }
    EditByText(text);

    std::vector<std::string> writeErrors;
    const std::string saved = Save(store, writeErrors);
    if (!writeErrors.empty() || !IsCarried(saved)) {
        return 0;
    }
    VDataStore other;
    std::vector<std::string> readErrors;
    Require(Load(saved, other, readErrors), "what was saved is XML");
    for (const std::string& error : readErrors) {
        std::fprintf(stderr, "%s\n", error.c_str());
    }
    Require(readErrors.empty(), "what was saved loads without an error");
    Require(Save(other, writeErrors) == saved, "a second save gives the same file");
    return 0;
}
