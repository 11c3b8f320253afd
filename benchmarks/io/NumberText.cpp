#include "NumberText.h"

#include "comparison/Comparison.h"
#include "io/ISchema.h"
#include "io/ValueText.h"

#include <boost/spirit/include/karma_char.hpp>
#include <boost/spirit/include/karma_generate.hpp>
#include <boost/spirit/include/karma_int.hpp>
#include <boost/spirit/include/karma_list.hpp>
#include <boost/spirit/include/karma_real.hpp>
#include <boost/spirit/include/qi_char.hpp>
#include <boost/spirit/include/qi_int.hpp>
#include <boost/spirit/include/qi_list.hpp>
#include <boost/spirit/include/qi_parse.hpp>
#include <boost/spirit/include/qi_real.hpp>

#include <charconv>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

namespace karma = boost::spirit::karma;
namespace qi = boost::spirit::qi;

namespace {

using KVR::IO::EType;
using KVR::IO::ISchema;

// Enough for the longest number with its comma.
constexpr std::size_t mostCharacters = 32;

// What value text may take, as a multiple of its bare generator and parser.
constexpr double mostForWriting = 1.05;
constexpr double mostForReading = 1.1;

struct VDoublePolicies : karma::real_policies<double>
{
    static unsigned precision(double) { return 16; }
};

/// The generator and the parser of a type, as one would write them without value text.
template <typename T>
struct VBare;

template <>
struct VBare<double>
{
    static constexpr EType type = EType::Float64;
    karma::real_generator<double, VDoublePolicies> generator;
    qi::real_parser<double, qi::real_policies<double>> parser;
};

template <>
struct VBare<std::int32_t>
{
    static constexpr EType type = EType::Int32;
    karma::int_generator<std::int32_t> generator;
    qi::int_parser<std::int32_t> parser;
};

std::vector<double> MakeNumbers(double, std::size_t count)
{
    std::mt19937_64 engine(1);
    std::uniform_real_distribution<double> distribution(-1000, 1000);
    std::vector<double> numbers(count);
    for (double& number : numbers) {
        number = distribution(engine);
    }
    return numbers;
}

std::vector<std::int32_t> MakeNumbers(std::int32_t, std::size_t count)
{
    std::mt19937 engine(1);
    std::vector<std::int32_t> numbers(count);
    for (std::int32_t& number : numbers) {
        // Of all lengths, not nearly all of ten digits.
        number = static_cast<std::int32_t>(engine()) >> (engine() % 31);
    }
    return numbers;
}

void Require(bool good, const char* what)
{
    if (!good) {
        throw std::runtime_error(what);
    }
}

template <typename T>
class VListText
{
public:
    explicit VListText(std::size_t count)
        : numbers(MakeNumbers(T(), count)), buffer(count * mostCharacters)
    {
        schema.Type = EType::List;
        schema.SubSchemas.emplace_back("", ISchema());
        schema.SubSchemas.front().second.Type = VBare<T>::type;

        const auto stored = static_cast<std::uint32_t>(count);
        bytes.resize(sizeof(stored) + count * sizeof(T));
        std::memcpy(bytes.data(), &stored, sizeof(stored));
        std::memcpy(bytes.data() + sizeof(stored), numbers.data(), count * sizeof(T));

        Write();
        WriteBareList();
        Require(text == bareText, "the texts differ");
        Read();
        ReadBareList();
        Require(std::memcmp(readBytes.data() + sizeof(stored), readNumbers.data(),
                            count * sizeof(T)) == 0,
                "the numbers differ");
    }

    nlohmann::json Measure(unsigned rounds)
    {
        const auto beside = [&](Work own, Work limit, std::optional<double> aim) {
            const auto run = [this](Work work) { return [this, work] { (this->*work)(); }; };
            return Compare(rounds, 1, run(own), run(limit), aim);
        };
        const auto write = &VListText::Write;
        const auto read = &VListText::Read;
        return {
            {"characters", text.size()},
            {"write", beside(write, &VListText::WriteBareList, mostForWriting)},
            {"write_beside_loop", beside(write, &VListText::WriteBareLoop, mostForWriting)},
            {"write_beside_buffer", beside(write, &VListText::WriteBareBuffer, std::nullopt)},
            {"write_beside_to_chars", beside(write, &VListText::WriteToChars, std::nullopt)},
            {"read", beside(read, &VListText::ReadBareList, mostForReading)},
            {"read_beside_loop", beside(read, &VListText::ReadBareLoop, mostForReading)},
        };
    }

private:
    using Work = void (VListText::*)();

    void Write()
    {
        Require(KVR::IO::BinaryToText(bytes, schema, text, KVR::IO::SchemaTextModeRow),
                "the value was not written");
    }

    /// The bare generator into a string, as value text has to end up in one.
    void WriteBareList()
    {
        bareText.clear();
        karma::generate(std::back_inserter(bareText), bare.generator % ',', numbers);
    }

    /// The same, number by number: the list of the grammar has a cost of its own.
    void WriteBareLoop()
    {
        bareText.clear();
        auto sink = std::back_inserter(bareText);
        for (const T number : numbers) {
            karma::generate(sink, bare.generator, number);
            bareText += ',';
        }
    }

    /// The least that the generator itself can cost: into memory that is large enough, which is not
    /// where a text ends up.
    void WriteBareBuffer()
    {
        char* next = buffer.data();
        for (const T number : numbers) {
            karma::generate(next, bare.generator, number);
            *next++ = ',';
        }
    }

    void WriteToChars()
    {
        char* next = buffer.data();
        char* const end = buffer.data() + buffer.size();
        for (const T number : numbers) {
            next = std::to_chars(next, end, number).ptr;
            *next++ = ',';
        }
    }

    void Read()
    {
        const char* begin = text.data();
        const char* const end = begin + text.size();
        Require(KVR::IO::TextToBinary(begin, end, schema, readBytes, KVR::IO::SchemaTextModeRow) &&
                    begin == end,
                "the text was not read");
    }

    /// The bare parser without its list.
    void ReadBareLoop()
    {
        readNumbers.clear();
        const char* begin = text.data();
        const char* const end = begin + text.size();
        T number{};
        while (qi::parse(begin, end, bare.parser, number)) {
            readNumbers.push_back(number);
            if (begin == end) {
                return;
            }
            ++begin;
        }
        throw std::runtime_error("the text was not parsed");
    }

    void ReadBareList()
    {
        readNumbers.clear();
        const char* begin = text.data();
        const char* const end = begin + text.size();
        Require(qi::parse(begin, end, bare.parser % ',', readNumbers) && begin == end,
                "the text was not parsed");
    }

    const VBare<T> bare{};
    const std::vector<T> numbers;
    ISchema schema;
    std::vector<unsigned char> bytes;
    std::vector<char> buffer;
    std::string text;
    std::string bareText;
    std::vector<unsigned char> readBytes;
    std::vector<T> readNumbers;
};

} // namespace

nlohmann::json MeasureNumberText(unsigned rounds, std::size_t count)
{
    return {
        {"count", count},
        {"double", VListText<double>(count).Measure(rounds)},
        {"int32", VListText<std::int32_t>(count).Measure(rounds)},
    };
}
