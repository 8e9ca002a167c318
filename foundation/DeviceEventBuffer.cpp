#include "foundation/DeviceEventBuffer.h"

#include "foundation/Log.h"

namespace cimple
{

int DeviceEventBuffer::add(const String& text)
{
    if (text.empty())
        return 0;
    TVR_LOG(TVR_DBG, "Handlelog ---  Prior to Inserting into DeviceLog Vector");
    if (_strings.size() >= _maximum)
        return 1;
    _strings.push_back(text);
    return 0;
}

} // namespace cimple
