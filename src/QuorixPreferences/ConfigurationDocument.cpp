#include "QuorixPreferences/ConfigurationDocument.h"

#include "UtilsFileSystem/ReadFile.h"
#include "UtilsRapidXml/ParseXml.h"

#include <optional>
#include <utility>

namespace {

/// Collects what the printer writes character by character, and passes it on in pieces: most of the
/// printer's time would otherwise go into asking the text for room.
class VPieces
{
public:
    explicit VPieces(std::string& target) : text(target) {}

    void Put(char character)
    {
        if (size == sizeof piece) {
            Flush();
        }
        piece[size++] = character;
    }

    void Flush()
    {
        text.append(piece, size);
        size = 0;
    }

private:
    std::string& text;
    std::size_t size = 0;
    char piece[4096];
};

/// The output iterator that the printer wants; copies of it write to the same place.
class VPieceIterator
{
public:
    explicit VPieceIterator(VPieces& target) : pieces(&target) {}

    VPieceIterator& operator=(char character)
    {
        pieces->Put(character);
        return *this;
    }
    VPieceIterator& operator*() { return *this; }
    VPieceIterator& operator++() { return *this; }
    VPieceIterator operator++(int) { return *this; }

private:
    VPieces* pieces;
};

} // namespace

bool VConfigurationDocument::Read(const boost::filesystem::path& path, std::size_t limit)
{
    std::optional<std::string> content = UtilsFileSystem::ReadFile(path, limit);
    if (!content) {
        return false;
    }
    text = std::move(*content);
    return UtilsRapidXml::ParseXml<0>(document, text.data());
}

std::string PrintDocument(const rapidxml::xml_document<char>& document)
{
    std::string text;
    VPieces pieces(text);
    rapidxml::print(VPieceIterator(pieces), document);
    pieces.Flush();
    return text;
}
