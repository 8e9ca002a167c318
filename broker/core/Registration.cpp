#include "broker/core/Registration.h"

#include <fstream>
#include <iterator>
#include <sstream>
#include <stdexcept>

namespace broker
{

Registration parseRegistration(std::string_view text)
{
    Registration registration;
    RegisteredClass* current = nullptr;
    std::istringstream lines{std::string(text)};
    for (std::string line; std::getline(lines, line);)
    {
        std::istringstream words(line);
        std::string name;
        words >> name;
        if (name.starts_with('[') && name.ends_with(']'))
            current = &registration[name.substr(1, name.size() - 2)];
        else if (current && name == "provider:")
            words >> current->provider;
        else if (current && name == "namespace:")
            current->nameSpaces.assign(std::istream_iterator<std::string>(words), {});
    }
    for (const auto& [name, entry] : registration)
        if (entry.provider.empty() || entry.nameSpaces.empty())
            throw std::runtime_error("the registration of " + name + " lacks its provider or its namespaces");
    return registration;
}

Registration readRegistration(const std::string& path)
{
    std::ifstream file(path);
    if (!file)
        throw std::runtime_error("cannot read the registration file " + path);
    return parseRegistration(std::string(std::istreambuf_iterator<char>(file), {}));
}

} // namespace broker
