#include "io/ValueTextNumbers.h"

#include "io/TextCursor.h"
#include "io/VectorReader.h"

// Only what is used: the library's full headers take twice the time and memory to compile.
#include <boost/spirit/include/karma_generate.hpp>
#include <boost/spirit/include/karma_int.hpp>
#include <boost/spirit/include/karma_real.hpp>
#include <boost/spirit/include/karma_uint.hpp>
#include <boost/spirit/include/qi_int.hpp>
#include <boost/spirit/include/qi_parse.hpp>
#include <boost/spirit/include/qi_real.hpp>
#include <boost/spirit/include/qi_uint.hpp>

#include <algorithm>
#include <cstring>
#include <limits>

namespace KVR {
namespace IO {
namespace Detail {

namespace {

namespace karma = boost::spirit::karma;
namespace qi = boost::spirit::qi;

/// The generator's own rules but for the digits behind the point: no trailing zeros, fixed for 0
/// and from 0.001 up to 100000, scientific otherwise.
template <typename T, unsigned digits>
struct VRealPolicies : karma::real_policies<T>
{
    static unsigned precision(T) { return digits; }
};

/// The parser's own rules, without what it does to extreme texts: an assertion of its own that a
/// number with very many zeros behind the point fails, and exponents that overflow when it adds the
/// places of the point to them.
template <typename T>
struct VRealParserPolicies : qi::real_policies<T>
{
    using Base = qi::real_policies<T>;

    template <typename Iterator>
    static std::size_t ignore_excess_digits(Iterator& first, const Iterator& last)
    {
        return std::min(Base::ignore_excess_digits(first, last),
                        static_cast<std::size_t>(mostPlaces));
    }

    template <typename Iterator, typename Attribute>
    static bool parse_frac_n(Iterator& first, const Iterator& last, Attribute& number, int& places)
    {
        if (!Base::parse_frac_n(first, last, number, places)) {
            return false;
        }
        constexpr int mostScalable = -2 * std::numeric_limits<T>::min_exponent10;
        if (places > mostScalable && !HasExponent(first, last)) {
            // Only zeros count so many places: what follows them is too small for the type.
            number = 0;
            places = 0;
        }
        places = std::min(places, mostPlaces);
        return true;
    }

    template <typename Iterator>
    static bool parse_exp_n(Iterator& first, const Iterator& last, int& exponent)
    {
        if (!Base::parse_exp_n(first, last, exponent)) {
            return false;
        }
        exponent = std::clamp(exponent, -mostPlaces, mostPlaces);
        return true;
    }

private:
    // Twice this fits an int.
    static constexpr int mostPlaces = 1000000000;

    template <typename Iterator>
    static bool HasExponent(Iterator first, const Iterator& last)
    {
        int exponent = 0;
        return Base::parse_exp(first, last) && Base::parse_exp_n(first, last, exponent);
    }
};

/// How numbers of a type are written and read.
template <typename T, typename Generator_, typename Parser_, typename Parsed_ = T>
struct VNumberTraits
{
    using Number = T;
    using Generator = Generator_;
    using Parser = Parser_;
    using Parsed = Parsed_; ///< what the parser yields; one wider than Number is range-checked
};

template <typename T>
using VSigned = VNumberTraits<T, karma::int_generator<T>, qi::int_parser<T>>;
template <typename T, typename Parsed = T>
using VUnsigned = VNumberTraits<T, karma::uint_generator<T>, qi::uint_parser<Parsed>, Parsed>;
template <typename T, unsigned digits>
using VReal = VNumberTraits<T, karma::real_generator<T, VRealPolicies<T, digits>>,
                            qi::real_parser<T, VRealParserPolicies<T>>>;

/// Calls `visitor` with the traits of a type.
template <typename Visitor>
void VisitNumber(EType type, Visitor visitor)
{
    switch (type) {
    case EType::Int8:
        visitor(VSigned<std::int8_t>());
        break;
    case EType::Int16:
        visitor(VSigned<std::int16_t>());
        break;
    case EType::Int32:
        visitor(VSigned<std::int32_t>());
        break;
    case EType::Int64:
        visitor(VSigned<std::int64_t>());
        break;
    case EType::UInt8:
        visitor(VUnsigned<std::uint8_t, std::uint16_t>());
        break;
    case EType::UInt16:
        visitor(VUnsigned<std::uint16_t>());
        break;
    case EType::UInt32:
        visitor(VUnsigned<std::uint32_t>());
        break;
    case EType::UInt64:
        visitor(VUnsigned<std::uint64_t>());
        break;
    case EType::Float32:
        visitor(VReal<float, 7>());
        break;
    case EType::Float64:
        visitor(VReal<double, 16>());
        break;
    default:
        break; // no number, and never asked for
    }
}

// Longer than any number with its comma: 5 digits, a point, 16 digits, a sign, or an exponent.
constexpr std::size_t longestNumber = 64;

template <typename Traits>
void WriteRun(Traits, std::uint32_t count, VVectorReader& reader, std::string& text)
{
    using Number = typename Traits::Number;
    if (count == 0) {
        return;
    }
    const typename Traits::Generator generator{};
    const unsigned char* packed = reader.Take(std::uint64_t{count} * sizeof(Number));
    char block[4096];
    char* next = block;
    for (std::uint32_t i = 0; i < count; ++i, packed += sizeof(Number)) {
        Number number;
        std::memcpy(&number, packed, sizeof(Number));
        karma::generate(next, generator, number);
        *next++ = ',';
        if (next > block + sizeof(block) - longestNumber) {
            text.append(block, next);
            next = block;
        }
    }
    text.append(block, next);
    text.pop_back(); // behind the last number stands no comma
}

/// Collects numbers, since growing the vector for each of them costs more than reading it.
template <typename T>
class VNumberBlock
{
public:
    explicit VNumberBlock(std::vector<unsigned char>& bytes_) : bytes(bytes_) {}
    VNumberBlock(const VNumberBlock&) = delete;
    VNumberBlock& operator=(const VNumberBlock&) = delete;

    void Add(T number)
    {
        numbers[used] = number;
        if (++used == capacity) {
            Flush();
        }
    }

    void Flush()
    {
        const auto* first = reinterpret_cast<const unsigned char*>(numbers);
        bytes.insert(bytes.end(), first, first + used * sizeof(T));
        used = 0;
    }

private:
    static constexpr std::size_t capacity = 256;

    std::vector<unsigned char>& bytes;
    T numbers[capacity];
    std::size_t used = 0;
};

template <typename Traits>
bool IsInRange([[maybe_unused]] typename Traits::Parsed number)
{
    if constexpr (sizeof(typename Traits::Parsed) > sizeof(typename Traits::Number)) {
        return number <= std::numeric_limits<typename Traits::Number>::max();
    }
    return true;
}

template <typename Traits>
bool ReadNumber(const typename Traits::Parser& parser, VTextCursor& cursor,
                typename Traits::Parsed& number)
{
    const char* const start = cursor.Position;
    if (qi::parse(cursor.Position, cursor.End, parser, number) && IsInRange<Traits>(number)) {
        return true;
    }
    cursor.Position = start; // the real parser moves on even where a number is too great
    return false;
}

template <typename Traits>
bool ReadRun(Traits, std::uint32_t limit, VTextCursor& sharedCursor,
             std::vector<unsigned char>& bytes, std::uint32_t& count)
{
    const typename Traits::Parser parser{};
    VNumberBlock<typename Traits::Number> block(bytes);
    VTextCursor cursor = sharedCursor;
    const bool good = ReadSeparated(cursor, limit, count, [&] {
        typename Traits::Parsed number{};
        cursor.SkipBlanks();
        if (!ReadNumber<Traits>(parser, cursor, number)) {
            return false;
        }
        block.Add(static_cast<typename Traits::Number>(number));
        cursor.SkipBlanks();
        return true;
    });
    block.Flush();
    sharedCursor = cursor;
    return good;
}

} // namespace

bool IsNumber(EType type)
{
    return type >= EType::Int8 && type <= EType::Float64;
}

void WriteNumbers(EType type, std::uint32_t count, VVectorReader& reader, std::string& text)
{
    VisitNumber(type, [&](auto traits) { WriteRun(traits, count, reader, text); });
}

bool ReadNumbers(EType type, std::uint32_t limit, VTextCursor& cursor,
                 std::vector<unsigned char>& bytes, std::uint32_t& count)
{
    bool good = false;
    VisitNumber(type, [&](auto traits) { good = ReadRun(traits, limit, cursor, bytes, count); });
    return good;
}

} // namespace Detail
} // namespace IO
} // namespace KVR
