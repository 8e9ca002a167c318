// What the parts of one broker share.
#pragma once

#include "broker/core/Arena.h"
#include "broker/core/Options.h"
#include "broker/core/Providers.h"
#include "broker/core/Registry.h"
#include "broker/core/Store.h"
#include "broker/core/UpcallChannel.h"
#include "broker/core/Violations.h"
#include "broker/tables/BrokerTables.h"
#include "broker/values/ClassInfo.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace broker
{

struct Core
{
    /// Opens the module. Throws std::runtime_error when it cannot.
    explicit Core(Options brokerOptions);

    /// Adds the running call to the text.
    void violation(const std::string& text) const { reportViolation(this, text); }

    Options options; ///< constant but for the image, which unload() lets go of
    BrokerTables tables;
    std::shared_ptr<ModuleImage> image;
    ClassTable classes;
    mutable Violations violations;
    Graveyard graveyard;
    Registry<Tracked, Tracked> clones; ///< not yet released
    Registry<CMPIContext, Frame>
        attachments; ///< of the provider's own threads, from prepareAttachThread to detachThread
    Store store;
    ProviderTable providers;
    UpcallChannel channel;
    std::atomic<std::size_t> openMarks{0};

    std::mutex indicationMutex;
    std::vector<Object> indications;
};

} // namespace broker
