// Generated files.
#pragma once

#include "schemac/Model.h"

#include <cstddef>
#include <filesystem>
#include <string>
#include <vector>

namespace schemac
{

struct OutputFile
{
    std::string name; ///< below the output folder
    std::string text;
};
using OutputFiles = std::vector<OutputFile>;

/// The record types: one header per class, and one with those of the classes that the module serves.
OutputFiles write_records(const Schema& schema);

/// The meta tables in `chunks` source files, and the repository.
OutputFiles write_tables(const Schema& schema, std::size_t chunks);

/// What people are shown of classes and their features: descriptions, units and the names of values. And the
/// declarations of qualifiers.
OutputFiles write_texts(const Schema& schema);

/// What CIM servers read: qualifiers.mof, cim_classes.mof and tavrin_classes.mof, to be compiled in this order into
/// each namespace, with a class after those it names; the registration of the providers as stanzas (.reg, the
/// small-footprint broker) and as instances (_registration.mof, the Open Group's server).
OutputFiles write_server_files(const Schema& schema, const std::string& version);

/// True for the classes that the module serves.
bool is_served(const Class& c);

/// Writes the files whose content differs from what is there, so that unchanged ones keep their time. Throws
/// std::runtime_error.
void save(const OutputFiles& files, const std::filesystem::path& folder);

} // namespace schemac
