#pragma once

#include "io/ISchema.h"
#include "io/RandomSchema.h"

/// Changes schemas at random, as releases of a program do.
class VSchemaMutation
{
public:
    explicit VSchemaMutation(std::uint32_t seed) : random(seed) {}

    /// Changes a schema so that its values can be carried over: numbers grow wider, members come,
    /// go and move, enums gain and rename entries. Only those of 32 bits get other numbers.
    void ChangeReadably(KVR::IO::ISchema& schema);

    /// Changes one part of a schema to anything.
    void ChangeAnything(KVR::IO::ISchema& schema);

private:
    bool Chance(std::uint32_t oneOf) { return random.Below(oneOf) == 0; }

    void ChangeMembers(KVR::IO::ISchema& schema);
    void ChangeEnum(KVR::IO::ISchema& schema);
    void WidenNumber(KVR::IO::ISchema& schema);

    VRandomSchema random;
    unsigned added = 0;
};

/// Gives every member of a NamedTuple a name of its own.
void MakeMemberNamesUnique(KVR::IO::ISchema& schema);
