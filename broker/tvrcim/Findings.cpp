#include "broker/tvrcim/Findings.h"

#include "broker/host/ReadableText.h"
#include "broker/tvrcim/Printing.h"

#include <algorithm>
#include <array>

namespace tvrcim
{

using namespace broker;

namespace
{

const char* word(State state)
{
    static constexpr std::array words{"ok", "note", "warning", "missing", "wrong"};
    return words[static_cast<std::size_t>(state)];
}

constexpr std::size_t wordWidth = 7;

bool isFailure(const Finding& finding)
{
    return finding.state == State::missing || finding.state == State::wrong;
}

std::string verdict(const Findings& findings)
{
    const auto failures = static_cast<std::uint64_t>(std::ranges::count_if(findings, isFailure));
    if (failures == 0)
        return "all that is needed is there";
    return countText(failures, "thing is", "things are") + " missing or wrong";
}

} // namespace

bool isComplete(const Findings& findings)
{
    return std::ranges::none_of(findings, isFailure);
}

void printFindings(std::ostream& out, const Findings& findings, bool colour)
{
    std::size_t width = 0;
    for (const Finding& finding : findings)
        width = std::max(width, displayWidth(finding.subject));
    for (const Finding& finding : findings)
    {
        const std::string state = padded(word(finding.state), wordWidth);
        out << (colour && isFailure(finding) ? "\x1b[1;31m" + state + "\x1b[0m" : state) << "  "
            << padded(finding.subject, width) << "  " << oneLine(finding.text) << '\n';
        if (!finding.remedy.empty())
            out << padded("", wordWidth + 2 + width) << "  -> " << oneLine(finding.remedy) << '\n';
    }
    out << verdict(findings) << '\n';
}

Json toJson(const Findings& findings)
{
    Json list = Json::array();
    for (const Finding& finding : findings)
    {
        Json row{{"state", word(finding.state)}, {"subject", finding.subject}, {"text", finding.text}};
        row["remedy"] = finding.remedy.empty() ? Json() : Json(finding.remedy);
        row.update(finding.facts);
        list.push_back(std::move(row));
    }
    return list;
}

} // namespace tvrcim
