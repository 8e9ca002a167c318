// The files of tag tables on their way from a client and to one.
#pragma once

#include <optional>
#include <string>

namespace cimple
{

/// The table that a client hands in. A file that had to be fetched is removed at the end.
class TagSource
{
public:
    /// Ends the method if there is no file.
    explicit TagSource(const std::string& uri);
    ~TagSource();
    TagSource(const TagSource&) = delete;
    TagSource& operator=(const TagSource&) = delete;

    /// Throws std::runtime_error for what is no plain file, such as a link, or is too large.
    std::string text() const;

private:
    std::string _file;
    bool _isFetched;
};

/// Where a client wants to have a table.
struct TagTarget
{
    std::string file; ///< in the folder for tables
    bool isElsewhere; ///< the file is only made to be sent
};

/// A plain name, a file URI of the folder, or the URI of another host, whose last part is then the file's name.
/// Nothing for what leads out of the folder or to no place that a file can be sent to.
std::optional<TagTarget> tagTargetOf(const std::string& uri);

} // namespace cimple
