#include "io/SchemaMutation.h"

#include "io/SchemaComparison.h"

#include <string>
#include <utility>

using namespace KVR::IO;

namespace {

constexpr VRandomSchema::Limits WithText()
{
    VRandomSchema::Limits limits;
    limits.withoutText = false;
    return limits;
}

} // namespace

void VSchemaMutation::ChangeReadably(ISchema& schema)
{
    if (schema.Type == EType::NamedTuple) {
        ChangeMembers(schema);
    }
    if (IsEnumType(schema.Type)) {
        ChangeEnum(schema);
    } else if (schema.Type != EType::Void && schema.Type <= EType::Float64 && Chance(2)) {
        WidenNumber(schema);
    }
    for (ISchema::SubSchema& part : schema.SubSchemas) {
        ChangeReadably(part.second);
    }
    if (Chance(4)) {
        schema.TypeName += "Renamed";
    }
}

void VSchemaMutation::ChangeMembers(ISchema& schema)
{
    std::vector<ISchema::SubSchema>& members = schema.SubSchemas;
    while (!members.empty() && Chance(3)) {
        members.erase(members.begin() + random.Below(static_cast<std::uint32_t>(members.size())));
    }
    while (Chance(3)) {
        const auto place = random.Below(static_cast<std::uint32_t>(members.size()) + 1);
        ISchema member = random.MakeSchema(2, WithText());
        MakeMemberNamesUnique(member);
        members.insert(members.begin() + place,
                       {"New" + std::to_string(++added), std::move(member)});
    }
    if (Chance(3)) {
        for (std::size_t i = members.size(); i > 1; --i) {
            std::swap(members[i - 1], members[random.Below(static_cast<std::uint32_t>(i))]);
        }
    }
}

void VSchemaMutation::ChangeEnum(ISchema& schema)
{
    std::vector<ISchema::EnumValue>& entries = schema.EnumValues;
    const bool renumber = schema.Type == EType::Enum32 && Chance(2);
    for (ISchema::EnumValue& entry : entries) {
        if (renumber) {
            entry.second = static_cast<std::int32_t>(static_cast<std::uint32_t>(entry.second) + 7);
        }
        if (Chance(3)) {
            entry.first = "LEGACY_" + entry.first;
        }
    }
    if (Chance(3)) {
        entries.emplace_back("Entry" + std::to_string(++added), renumber ? 100000 : 101);
    }
    if (!entries.empty() && Chance(3)) {
        std::swap(entries.front(), entries.back());
    }
    if (!renumber && Chance(3)) {
        schema.Type = static_cast<EType>(static_cast<int>(EType::Enum8) + random.Below(3));
    }
}

void VSchemaMutation::WidenNumber(ISchema& schema)
{
    const EType stored = schema.Type;
    do {
        schema.Type = static_cast<EType>(random.Below(21));
    } while (!IsReadableAs(stored, schema.Type));
}

void VSchemaMutation::ChangeAnything(ISchema& schema)
{
    if (!schema.SubSchemas.empty() && !Chance(4)) {
        const auto part = random.Below(static_cast<std::uint32_t>(schema.SubSchemas.size()));
        ChangeAnything(schema.SubSchemas[part].second);
    } else if (schema.Type == EType::Array && Chance(2)) {
        ++schema.Count;
    } else if (IsEnumType(schema.Type) && !schema.EnumValues.empty() && Chance(2)) {
        schema.EnumValues.pop_back();
    } else {
        schema = random.MakeSchema(2, {});
        MakeMemberNamesUnique(schema);
    }
}

void MakeMemberNamesUnique(ISchema& schema)
{
    for (std::size_t i = 0; i < schema.SubSchemas.size(); ++i) {
        ISchema::SubSchema& part = schema.SubSchemas[i];
        if (schema.Type == EType::NamedTuple) {
            part.first += std::to_string(i);
        }
        MakeMemberNamesUnique(part.second);
    }
}
