// schemac: reads the MOF sources and writes what is generated from them.
#include "schemac/Check.h"
#include "schemac/Output.h"
#include "schemac/Parser.h"

#include <cstdlib>
#include <exception>
#include <fstream>
#include <iostream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <vector>

namespace
{

constexpr const char* usage = "usage: schemac --cpp FOLDER CHUNKS FILE.mof...   record types and meta tables\n"
                              "       schemac --mof FOLDER FILE.mof...          files for CIM servers\n"
                              "       schemac --check FILE.mof...               refusals only\n";

void read_source(const std::string& path, schemac::Schema& schema)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
    {
        throw std::runtime_error("cannot read " + path);
    }
    schemac::parse(std::string(std::istreambuf_iterator<char>(in), {}), path, schema);
}

/// The resolved schema, or nothing after printing what is refused.
bool read_schema(const std::vector<std::string>& paths, schemac::Schema& schema)
{
    for (const std::string& path : paths)
    {
        read_source(path, schema);
    }
    const std::vector<std::string> refusals = schemac::check(schema);
    for (const std::string& refusal : refusals)
    {
        std::cerr << refusal << '\n';
    }
    return refusals.empty();
}

int run(std::vector<std::string> arguments)
{
    const auto take = [&]
    {
        std::string first = arguments.empty() ? "" : arguments.front();
        arguments.erase(arguments.begin(), arguments.begin() + !arguments.empty());
        return first;
    };
    const std::string mode = take();
    const std::string folder = mode == "--check" ? "" : take();
    const long chunks = mode == "--cpp" ? std::strtol(take().c_str(), nullptr, 10) : 1;
    const bool known = mode == "--cpp" || mode == "--mof" || mode == "--check";
    if (!known || chunks < 1 || arguments.empty())
    {
        std::cerr << usage;
        return 2;
    }
    schemac::Schema schema;
    if (!read_schema(arguments, schema))
    {
        return 1;
    }
    if (mode == "--cpp")
    {
        schemac::save(schemac::write_records(schema), folder);
        schemac::save(schemac::write_tables(schema, static_cast<std::size_t>(chunks)), folder);
    }
    else if (mode == "--mof")
    {
        schemac::save(schemac::write_server_files(schema), folder);
    }
    return 0;
}

} // namespace

int main(int argc, char** argv)
{
    try
    {
        return run({argv + 1, argv + argc});
    }
    catch (const std::exception& e)
    {
        std::cerr << e.what() << '\n';
        return 1;
    }
}
