#include "schemac/Output.h"

#include <fstream>
#include <iterator>
#include <stdexcept>

namespace schemac
{

bool is_served(const Class& c)
{
    return c.name.starts_with("TVRHBA_");
}

static bool holds_already(const std::filesystem::path& path, const std::string& text)
{
    std::ifstream in(path, std::ios::binary);
    return in && std::string(std::istreambuf_iterator<char>(in), {}) == text;
}

void save(const OutputFiles& files, const std::filesystem::path& folder)
{
    for (const OutputFile& file : files)
    {
        const std::filesystem::path path = folder / file.name;
        if (holds_already(path, file.text))
            continue;
        std::filesystem::create_directories(path.parent_path());
        std::ofstream out(path, std::ios::binary);
        out << file.text;
        out.close();
        if (!out)
            throw std::runtime_error("cannot write " + path.string());
    }
}

} // namespace schemac
