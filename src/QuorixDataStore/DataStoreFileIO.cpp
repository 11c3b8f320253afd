#include "QuorixDataStore/DataStoreFileIO.h"

#include "QuorixDataStore/ConfigurationReader.h"
#include "QuorixDataStore/ConfigurationWriter.h"
#include "utils/LogStatement.h"

namespace DataStoreFileIO {

bool ReadConfiguration(const rapidxml::xml_document<char>& document, IDataVerifyWriter& writer)
{
    std::vector<std::string> errors;
    std::vector<std::string> warnings;
    const bool good = ReadConfiguration(document, writer, errors, warnings);
    for (const std::string& warning : warnings) {
        KVR_LOG("DataStore", 3, "%1%", warning);
    }
    for (const std::string& error : errors) {
        KVR_LOG("DataStore", 2, "%1%", error);
    }
    return good;
}

bool ReadConfiguration(const rapidxml::xml_document<char>& document, IDataVerifyWriter& writer,
                       std::vector<std::string>& errors, std::vector<std::string>& warnings)
{
    const std::size_t before = errors.size();
    VConfigurationReader(document, writer).Read(errors, warnings);
    return errors.size() == before;
}

bool WriteConfiguration(const IDataVerifyReader& reader, rapidxml::xml_document<char>& document)
{
    std::vector<std::string> errors;
    const bool good =
        WriteConfiguration(reader, document, DataStoreFileFormat::CurrentVersion, errors);
    for (const std::string& error : errors) {
        KVR_LOG("DataStore", 2, "%1%", error);
    }
    return good;
}

bool WriteConfiguration(const IDataVerifyReader& reader, rapidxml::xml_document<char>& document,
                        const UtilsRapidXml::IVersion& version, std::vector<std::string>& errors)
{
    const std::size_t before = errors.size();
    VConfigurationWriter(reader, document, version).Write(errors);
    return errors.size() == before;
}

} // namespace DataStoreFileIO
