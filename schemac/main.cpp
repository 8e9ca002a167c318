// schemac: reads the MOF sources and writes what is generated from them.
#include "schemac/Check.h"
#include "schemac/Output.h"
#include "schemac/Parser.h"

#include <exception>
#include <fstream>
#include <iostream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <vector>

namespace
{

constexpr const char* usage =
    "usage: schemac --cpp FOLDER CHUNKS FILE.mof...   record types, meta tables, texts for people\n"
    "       schemac --mof FOLDER VERSION FILE.mof...  files for CIM servers\n"
    "       schemac --check FILE.mof...               refusals only\n";

void read_source(const std::string& path, schemac::Schema& schema)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
        throw std::runtime_error("cannot read " + path);
    schemac::parse(std::string(std::istreambuf_iterator<char>(in), {}), path, schema);
}

/// The resolved schema, or nothing after printing what is refused.
bool read_schema(const std::vector<std::string>& paths, schemac::Schema& schema)
{
    for (const std::string& path : paths)
        read_source(path, schema);
    const std::vector<std::string> refusals = schemac::check(schema);
    for (const std::string& refusal : refusals)
        std::cerr << refusal << '\n';
    return refusals.empty();
}

/// Writes what `mode` asks for; `option` is the number of chunks or the module's version.
void write(const schemac::Schema& schema, const std::string& mode, const std::string& folder, const std::string& option)
{
    if (mode == "--cpp")
    {
        schemac::save(schemac::write_records(schema), folder);
        schemac::save(schemac::write_tables(schema, std::stoul(option)), folder);
        schemac::save(schemac::write_texts(schema), folder);
    }
    else
    {
        schemac::save(schemac::write_server_files(schema, option), folder);
    }
}

int run(const std::vector<std::string>& arguments)
{
    const std::string mode = arguments.empty() ? "" : arguments.front();
    const bool writes = mode == "--cpp" || mode == "--mof";
    const std::size_t num_options = writes ? 3 : 1;
    if ((!writes && mode != "--check") || arguments.size() <= num_options)
    {
        std::cerr << usage;
        return 2;
    }
    schemac::Schema schema;
    if (!read_schema({arguments.begin() + num_options, arguments.end()}, schema))
        return 1;
    if (writes)
        write(schema, mode, arguments[1], arguments[2]);
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
