// The functions that the simulated libraries export, and what faults each of them can show.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace tvrsim
{

enum class Library : std::uint8_t
{
    local,    ///< liblrmapi.so
    fallback, ///< librmapi.so
    hbaApi,   ///< libHBAAPI.so.2
    tagging,  ///< libtvrsim_tagging.so
};

/// Ways in which an output can be hostile.
enum class Hostile : std::uint8_t
{
    hugeCount,        ///< a count of all ones
    hugeLength,       ///< a length of all ones
    unterminatedText, ///< texts fill their room and have no zero byte
    allOnes,          ///< every byte of the output is 0xFF
    zeroHandle,
};

/// Bits of an effect mask: 1 << Hostile, and this one for outputs that can be cut short.
constexpr unsigned truncatable = 1u << 31;
constexpr unsigned bit(Hostile kind)
{
    return 1u << static_cast<unsigned>(kind);
}

/// How a scenario names the kinds.
struct HostileRow
{
    const char* name;
    Hostile kind;
};
inline constexpr HostileRow hostileRows[] = {
    {"hugeCount", Hostile::hugeCount},
    {"hugeLength", Hostile::hugeLength},
    {"unterminatedText", Hostile::unterminatedText},
    {"allOnes", Hostile::allOnes},
    {"zeroHandle", Hostile::zeroHandle},
};

/// Exported names of a library, sorted.
std::vector<std::string> exportedNames(Library library);

/// Whether any library exports `function`; if so, `effects` gets its mask.
bool findEntryPoint(std::string_view function, unsigned& effects);

} // namespace tvrsim
