// What the parts of one broker share.
#pragma once

#include "broker/Arena.h"
#include "broker/ClassInfo.h"
#include "broker/Options.h"
#include "broker/Providers.h"
#include "broker/Store.h"
#include "broker/Violations.h"

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace broker
{

/// Frames of the provider's own threads, from prepareAttachThread to detachThread.
class Attachments
{
public:
    void add(std::unique_ptr<Frame> frame);
    /// Null if no frame has this context.
    Frame* find(const CMPIContext* context) const;
    std::unique_ptr<Frame> take(const CMPIContext* context);
    std::size_t count() const;

private:
    mutable std::mutex _mutex;
    std::map<const CMPIContext*, std::unique_ptr<Frame>> _frames;
};

struct Core
{
    /// Opens the module. Throws std::runtime_error when it cannot.
    explicit Core(Options brokerOptions);

    /// Adds the running call to the text.
    void violation(const std::string& text) const { reportViolation(this, text); }

    Options options; ///< constant but for the image, which unload() lets go of
    std::shared_ptr<ModuleImage> image;
    ClassTable classes;
    mutable Violations violations;
    Graveyard graveyard;
    CloneRegistry clones;
    Attachments attachments;
    Store store;
    ProviderTable providers;
    std::atomic<std::size_t> openMarks{0};

    std::mutex indicationMutex;
    std::vector<Object> indications;
};

} // namespace broker
