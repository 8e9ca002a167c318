#include "broker/values/Utf8.h"

#include <algorithm>
#include <array>

namespace broker
{

std::size_t longCharacter(std::string_view text)
{
    struct Form
    {
        unsigned char first, last;           ///< leading byte
        unsigned char secondLow, secondHigh; ///< byte behind it
        std::size_t length;
    };
    static constexpr std::array<Form, 8> forms{{{0xC2, 0xDF, 0x80, 0xBF, 2},
                                                {0xE0, 0xE0, 0xA0, 0xBF, 3},
                                                {0xE1, 0xEC, 0x80, 0xBF, 3},
                                                {0xED, 0xED, 0x80, 0x9F, 3},
                                                {0xEE, 0xEF, 0x80, 0xBF, 3},
                                                {0xF0, 0xF0, 0x90, 0xBF, 4},
                                                {0xF1, 0xF3, 0x80, 0xBF, 4},
                                                {0xF4, 0xF4, 0x80, 0x8F, 4}}};
    const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    for (const Form& form : forms)
    {
        const bool leads = byte(0) >= form.first && byte(0) <= form.last && text.size() >= form.length;
        if (leads && byte(1) >= form.secondLow && byte(1) <= form.secondHigh &&
            std::all_of(text.begin() + 2, text.begin() + static_cast<std::ptrdiff_t>(form.length),
                        [](char c) { return (static_cast<unsigned char>(c) & 0xC0) == 0x80; }))
            return form.length;
    }
    return 0;
}

} // namespace broker
