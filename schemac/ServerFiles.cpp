#include "schemac/Output.h"
namespace schemac
{
OutputFiles write_server_files(const Schema&)
{
    return {};
}
} // namespace schemac
