#include "logs/NewestLines.h"

#include "runtime/base/RegularFile.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <string>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace cimple
{

namespace
{

/// Fits the processor's second cache: what has been read is searched there.
constexpr std::size_t blockSize = 256 * 1024;

/// Finds the lines in blocks that come in from the end of the file to its begin.
class LineSearch
{
public:
    LineSearch(std::string_view keyword, const std::function<bool(std::string_view)>& take)
        : _keyword(keyword), _take(take)
    {}

    /// What stands before all that came in so far. False when no more is wanted.
    bool searchBlock(std::string_view block);
    /// Nothing stands before what came in so far, or what does has gone.
    bool endLine();

private:
    /// A line in a block.
    struct Match
    {
        std::size_t begin, size;
    };

    bool hasKeyword(std::string_view text) const
    {
        return memmem(text.data(), text.size(), _keyword.data(), _keyword.size()) != nullptr;
    }
    void prepend(std::string_view piece);
    bool searchLines(std::string_view lines);

    const std::string_view _keyword;
    const std::function<bool(std::string_view)>& _take;
    std::string _head;     ///< of the line whose begin has not come in: the first that a client gets of it so far
    bool _matches = false; ///< that line has the keyword in what has come in
    std::vector<Match> _found;
};

bool LineSearch::searchBlock(std::string_view block)
{
    const std::size_t first = block.find('\n');
    const std::size_t last = block.rfind('\n');
    if (first == block.npos)
    {
        prepend(block);
        return true;
    }
    prepend(block.substr(last + 1));
    if (!endLine() || !searchLines(block.substr(first + 1, last - first)))
        return false;
    prepend(block.substr(0, first));
    return true;
}

bool LineSearch::endLine()
{
    const bool goesOn = !_matches || _take(_head);
    _head.clear();
    _matches = false;
    return goesOn;
}

void LineSearch::prepend(std::string_view piece)
{
    if (!_matches)
    {
        const std::size_t beside = _keyword.size() - 1; // bytes on either side of the seam
        std::string seam(piece.substr(piece.size() - std::min(piece.size(), beside)));
        seam.append(_head, 0, beside);
        _matches = hasKeyword(piece) || hasKeyword(seam);
    }
    _head.insert(0, piece.substr(0, longestLine));
    _head.resize(std::min(_head.size(), longestLine));
}

/// Of whole lines, each with its line feed.
bool LineSearch::searchLines(std::string_view lines)
{
    _found.clear();
    for (std::size_t from = 0;
         const void* found = memmem(lines.data() + from, lines.size() - from, _keyword.data(), _keyword.size());)
    {
        const std::size_t at = static_cast<std::size_t>(static_cast<const char*>(found) - lines.data());
        const std::size_t begin = lines.rfind('\n', at) + 1;
        from = lines.find('\n', at) + 1;
        _found.push_back({begin, std::min(from - 1 - begin, longestLine)});
    }
    return std::all_of(_found.rbegin(), _found.rend(),
                       [&](const Match& match) { return _take(lines.substr(match.begin, match.size)); });
}

/// Whether nothing was ever written there, as ahead of what is written on after a log was emptied under its writer.
bool isHole(const File_Descriptor& file, std::size_t begin, std::size_t end)
{
    const off_t data = lseek(file.get(), static_cast<off_t>(begin), SEEK_DATA);
    if (data >= 0)
        return static_cast<std::size_t>(data) >= end;
    struct stat status; // behind the last data, or behind the end of a file that was cut off
    return errno == ENXIO && fstat(file.get(), &status) == 0 && static_cast<std::size_t>(status.st_size) >= end;
}

} // namespace

void newestLinesWith(const char* path, std::string_view keyword, const std::function<bool(std::string_view)>& take)
{
    const File_Descriptor file = open_regular(path, O_RDONLY);
    struct stat status;
    if (!file || fstat(file.get(), &status) != 0)
        return;
    const auto block = std::make_unique_for_overwrite<char[]>(blockSize);
    LineSearch search(keyword, take);
    for (auto end = static_cast<std::size_t>(status.st_size); end > 0;)
    {
        const std::size_t begin = (end - 1) / blockSize * blockSize;
        if (isHole(file, begin, end))
        {
            // Zero bytes, of which a line shows no more than this.
            static constexpr char zeros[longestLine] = {};
            if (!search.searchBlock({zeros, std::min(end - begin, longestLine)}))
                return;
            end = begin;
            continue;
        }
        // The kernel reads ahead of those alone that go forward.
        if (begin > 0)
            posix_fadvise(file.get(), static_cast<off_t>(begin - blockSize), blockSize, POSIX_FADV_WILLNEED);
        if (lseek(file.get(), static_cast<off_t>(begin), SEEK_SET) < 0)
            return;
        const ssize_t size = read_up_to(file.get(), block.get(), end - begin);
        if (size < 0)
            return;
        // Cut off meanwhile: what followed does not follow on this.
        if (static_cast<std::size_t>(size) < end - begin && !search.endLine())
            return;
        if (!search.searchBlock({block.get(), static_cast<std::size_t>(size)}))
            return;
        end = begin;
    }
    search.endLine();
}

} // namespace cimple
