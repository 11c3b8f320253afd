#include "FakeHost/Recording.h"

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/Utf8.h"

#include <cmath>
#include <istream>
#include <optional>

#include <nlohmann/json.hpp>

namespace FakeHost {

namespace {

using VJson = nlohmann::ordered_json;

constexpr const char* FormatName = "korva-control recording";
constexpr int FormatVersion = 1;

struct VKindName
{
    ERecorded Kind;
    const char* Name;
};

constexpr VKindName KindNames[] = {
    {ERecorded::Connected, "connected"},
    {ERecorded::Device, "device"},
    {ERecorded::Host, "host"},
    {ERecorded::Closed, "closed"},
};

bool IsFrame(ERecorded kind)
{
    return kind == ERecorded::Device || kind == ERecorded::Host;
}

std::string ToHex(const std::string& bytes)
{
    constexpr const char* digits = "0123456789abcdef";
    std::string text;
    for (const char byte : bytes) {
        text += digits[static_cast<unsigned char>(byte) >> 4U];
        text += digits[static_cast<unsigned char>(byte) & 15U];
    }
    return text;
}

std::optional<unsigned> HexDigit(char character)
{
    if (character >= '0' && character <= '9') {
        return static_cast<unsigned>(character - '0');
    }
    if (character >= 'a' && character <= 'f') {
        return static_cast<unsigned>(character - 'a' + 10);
    }
    return std::nullopt;
}

std::optional<std::string> FromHex(const std::string& text)
{
    std::string bytes;
    for (std::size_t i = 0; i + 1 < text.size(); i += 2) {
        const auto high = HexDigit(text[i]);
        const auto low = HexDigit(text[i + 1]);
        if (!high || !low) {
            return std::nullopt;
        }
        bytes += static_cast<char>(*high << 4U | *low);
    }
    return text.size() % 2 == 0 ? std::optional<std::string>(bytes) : std::nullopt;
}

/// Reads what a frame holds. @return whether it is there
bool ReadText(const VJson& object, std::string& text)
{
    if (object.contains("text") && object["text"].is_string()) {
        text = object["text"].get<std::string>();
        return true;
    }
    if (object.contains("hex") && object["hex"].is_string()) {
        const auto bytes = FromHex(object["hex"].get<std::string>());
        text = bytes.value_or(std::string());
        return bytes.has_value();
    }
    return false;
}

/// @return why the line is none of a recording, empty where it is
std::string ReadMoment(const VJson& object, VRecordedMoment& moment)
{
    const auto seconds = object.find("seconds");
    const auto connection = object.find("connection");
    const auto what = object.find("what");
    if (seconds == object.end() || !seconds->is_number() ||
        !std::isfinite(seconds->get<double>()) || seconds->get<double>() < 0) {
        return "\"seconds\" must be a number from 0 on";
    }
    if (connection == object.end() || !connection->is_number_unsigned() ||
        connection->get<std::uint64_t>() == 0 || connection->get<std::uint64_t>() > 1000000) {
        return "\"connection\" must be a whole number above 0";
    }
    moment.Seconds = seconds->get<double>();
    moment.Connection = connection->get<unsigned>();
    for (const VKindName& kind : KindNames) {
        if (what != object.end() && *what == kind.Name) {
            moment.Kind = kind.Kind;
            const bool good = !IsFrame(kind.Kind) || ReadText(object, moment.Text);
            return good ? "" : "a frame needs its \"text\", or its bytes as \"hex\"";
        }
    }
    return R"("what" must be "connected", "device", "host" or "closed")";
}

bool IsHead(const VJson& object)
{
    return object.contains("recording") && object["recording"] == FormatName &&
           object.contains("version") && object["version"] == FormatVersion;
}

} // namespace

std::string ToLine(const VRecordedMoment& moment)
{
    VJson object;
    object["seconds"] = std::round(moment.Seconds * 1e6) / 1e6;
    object["connection"] = moment.Connection;
    for (const VKindName& kind : KindNames) {
        if (kind.Kind == moment.Kind) {
            object["what"] = kind.Name;
        }
    }
    if (IsFrame(moment.Kind) && ControlStream::IsUtf8(moment.Text)) {
        object["text"] = moment.Text;
    } else if (IsFrame(moment.Kind)) {
        object["hex"] = ToHex(moment.Text);
    }
    return object.dump();
}

std::string HeadLine(const std::string& host)
{
    return VJson{{"recording", FormatName}, {"version", FormatVersion}, {"host", host}}.dump(
        -1, ' ', false, VJson::error_handler_t::replace);
}

std::vector<VRecordedMoment> ReadRecording(std::istream& input, const std::string& name)
{
    std::vector<VRecordedMoment> moments;
    std::string line;
    for (int number = 1; std::getline(input, line); ++number) {
        const VJson object = VJson::parse(line, nullptr, false);
        std::string reason = "it is no JSON object";
        VRecordedMoment moment;
        if (object.is_object()) {
            if (number == 1) {
                reason = IsHead(object) ? "" : "it is not the head of a recording";
            } else {
                reason = ReadMoment(object, moment);
            }
        }
        if (!reason.empty()) {
            reason.insert(0, name + ", line " + std::to_string(number) + ": ");
            throw ControlStream::VError(ControlStream::EErrorKind::Usage, reason);
        }
        if (number > 1) {
            moments.push_back(std::move(moment));
        }
    }
    if (moments.empty()) {
        throw ControlStream::VError(ControlStream::EErrorKind::Usage,
                                    name + " holds nothing that was recorded");
    }
    return moments;
}

} // namespace FakeHost
