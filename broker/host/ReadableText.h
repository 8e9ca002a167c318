// Numbers of instances as a person reads them.
#pragma once

#include "broker/values/ClassInfo.h"
#include "broker/values/OneLine.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace broker
{

/// "500 GiB", "1.5 TiB", "512 bytes".
std::string sizeText(std::uint64_t bytes);
/// "8 Gbit/s", "2.5 Gbit/s"; empty for 0, which is no speed.
std::string speedText(std::uint64_t bitsPerSecond);
/// A unit of the schema as people write it: "°C" for "degree celsius".
std::string unitText(std::string_view unit);
/// A number in a unit of the schema ("bit / second"), or those of an array: "16 Gbit/s", "100 GiB", "38.5 °C". A larger
/// unit is used where it says the number to the last digit.
std::string measureText(std::string_view unit, const Value& value);
/// A value on one line, with its name or in its unit where the schema has one for the feature of the class, which may
/// be unknown.
std::string shownText(const ClassInfo* info, const Value& value, std::string_view feature,
                      std::string_view parameter = {});
/// "1 card", "2 cards".
std::string countText(std::uint64_t count, const char* singular, const char* plural);
/// The name of a kind inside a sentence: "card" and "FC port".
std::string inSentence(std::string name);
/// Its letters of ASCII as capitals.
std::string inCapitals(std::string text);
/// Blanks at the ends and more than one between words are left out, as fixed fields of devices have them.
std::string withSingleBlanks(const std::string& text);
/// Characters that a UTF-8 text shows.
std::size_t displayWidth(const std::string& text);
/// The text filled up with blanks on the right.
std::string padded(const std::string& text, std::size_t width);
/// The text, or its head with an ellipsis where it shows more characters than that.
std::string shortened(const std::string& text, std::size_t characters);

/// The text in lines of that many characters, broken at blanks. A longer word is shortened.
std::vector<std::string> lines(const std::string& text, std::size_t characters);

} // namespace broker
