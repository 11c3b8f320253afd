#pragma once

#include "io/ISchema.h"

#include <cstdint>
#include <random>
#include <string>
#include <vector>

/// Makes random schemas and, by an encoder of its own, random values of them. The same seed gives
/// the same ones on every machine.
class VRandomSchema
{
public:
    explicit VRandomSchema(std::uint32_t seed) : engine(seed) {}

    /// What a value must not contain to be able to read back from a text.
    struct Limits
    {
        bool withoutText = true; ///< Void and Ref occur
        bool plainWords = false; ///< words are letters only
    };

    /// Returns a schema of at most `depth` levels with every type in it sooner or later.
    KVR::IO::ISchema MakeSchema(unsigned depth, const Limits& limits);

    /// Returns a schema in which every member is random, also those that a value does not need.
    KVR::IO::ISchema MakeFullSchema(unsigned depth);

    /// Appends a value. Real numbers are such as have few digits, since others do not read back.
    void AppendValue(std::vector<unsigned char>& bytes, const KVR::IO::ISchema& schema,
                     const Limits& limits);

    /// Returns a number below `end`.
    std::uint32_t Below(std::uint32_t end) { return static_cast<std::uint32_t>(engine() % end); }

private:
    std::string MakeName();
    std::string MakeText(const Limits& limits);
    void AppendBytes(std::vector<unsigned char>& bytes, std::uint64_t number, unsigned width);
    double MakeReal();

    std::mt19937 engine;
};
