// For targets whose input is one JSON text: libFuzzer mutates it by the grammar.

#include <algorithm>
#include <cstdint>

#include "support/json_grammar.h"

using VANO::FUZZ::JsonGrammar;

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t *data, std::size_t size,
                                               std::size_t maxSize, unsigned seed) {
    const std::string text(reinterpret_cast<const char *>(data), size);
    const std::string mutated = JsonGrammar(seed).Mutate(text, maxSize);
    return static_cast<std::size_t>(std::copy(mutated.begin(), mutated.end(), data) - data);
}

extern "C" std::size_t LLVMFuzzerCustomCrossOver(const std::uint8_t *data, std::size_t size,
                                                 const std::uint8_t *other, std::size_t otherSize,
                                                 std::uint8_t *out, std::size_t maxSize,
                                                 unsigned seed) {
    const std::string crossed = JsonGrammar(seed).Cross(
        std::string(reinterpret_cast<const char *>(data), size),
        std::string(reinterpret_cast<const char *>(other), otherSize), maxSize);
    return static_cast<std::size_t>(std::copy(crossed.begin(), crossed.end(), out) - out);
}
