#include "diagnostics/DiagnosticSettings.h"

#include "agent/Maps.h"
#include "device/TVR_MethodWrapper.h"
#include "diagnostics/TestCatalog.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"
#include "schema/TVRHBA_JobSettingData.h"

#include <algorithm>
#include <charconv>

namespace cimple
{

namespace
{

using Settings = TVRHBA_FCHBADiagnosticSettingData;

constexpr std::uint16_t loopByCount = 3;
constexpr std::uint32_t mostLoops = 4000;
constexpr std::size_t loopDigits = 4;
constexpr std::uint32_t mostBytes = 8;

constexpr LogText usingOverrides = {TVR_DBG,
                                    "Using the overrided values if valid, else default settings values are used"};

/// The first element of what a client sent; null if it is an empty array.
template <class T> const T* firstOf(const Property<Array<T>>& sent)
{
    return sent.value.size() == 0 ? nullptr : &sent.value[0];
}

bool isHexDigit(std::uint8_t c)
{
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'F') || (c >= 'a' && c <= 'f');
}

// --- what a client may set for a test that sends a pattern

void takeLoopControl(const Settings& input, Settings& settings)
{
    if (input.LoopControl.null)
        return;
    const std::uint16_t* control = firstOf(input.LoopControl);
    if (control)
        TVR_LOG(TVR_DBG, "Input LoopControl : %d", *control);
    if (control && *control == loopByCount)
        settings.LoopControl.set({*control});
    else
        TVR_LOG(TVR_DBG, "Invalid LoopControl, Valid value is '3'. Using the default value");
}

void takeLoopControlParameter(const Settings& input, Settings& settings)
{
    if (input.LoopControlParameter.null)
        return;
    const String* parameter = firstOf(input.LoopControlParameter);
    if (parameter)
        TVR_LOG(TVR_DBG, "Input LoopControlParam : %s", parameter->c_str());
    if (parameter && loopCount(parameter->view()))
        settings.LoopControlParameter.set({*parameter});
    else
        TVR_LOG(TVR_DBG, "Invalid LoopControlParam, Valid value range[1-4000]. Using the default value");
}

void takeHaltOnError(const Settings& input, Settings& settings)
{
    if (!input.HaltOnError.null)
        settings.HaltOnError.set(input.HaltOnError.value);
}

void takeBufferSizes(const Settings& input, Settings& settings)
{
    if (input.BufferSizes.null)
        return;
    const std::uint32_t* size = firstOf(input.BufferSizes);
    if (size)
        TVR_LOG(TVR_DBG, "Input Buffer Size : %d", *size);
    if (size && *size <= mostBytes)
        settings.BufferSizes.set({*size});
    else
        TVR_LOG(TVR_DBG, "Invalid BufferSizes, Valid value is '<8'. Using the default value");
}

/// Of the size that is in force by then.
void takeBufferPattern(const Settings& input, Settings& settings)
{
    if (input.BufferPattern.null)
        return;
    const std::uint32_t* size = firstOf(settings.BufferSizes);
    if (const auto pattern = fitPattern(input.BufferPattern.value, size ? *size : 0))
    {
        TVR_LOG(TVR_DBG, "Valid Pattern entered");
        settings.BufferPattern.set(*pattern);
    }
    else
        TVR_LOG(TVR_DBG, "Invalid BufferPattern, Use hex values. Using the default value");
}

constexpr void (*rules[])(const Settings& input, Settings& settings) = {
    takeLoopControl, takeLoopControlParameter, takeHaltOnError, takeBufferSizes, takeBufferPattern,
};

void takeTarget(const Settings& input, Settings& settings)
{
    TVR_LOG(TVR_DBG, "Checking the Echo test targetdevice");
    if (input.LUN.null)
        TVR_LOG(TVR_DBG, "Invalid LUN, Using the default value '0' ");
    else
        settings.LUN.set(input.LUN.value);

    constexpr std::size_t digitsOfName = 16;
    if (input.TargetDevice.null || input.TargetDevice.value.size() != digitsOfName)
        return;
    const char* target = input.TargetDevice.value.c_str();
    TVR_LOG(TVR_DBG, "Input TargetDevice : %s", target);
    char name[TVR_MethodWrapper::hbaNameLength + 1];
    if (TVR_MethodWrapper::Id2HBAName(name, target) == 0)
        settings.TargetDevice.set(input.TargetDevice.value);
    else
    {
        TVR_LOG(TVR_DBG, "getTVRHBA_FCHBADiagnosticSettingDataInstance::Id2HBAName failed");
        settings.TargetDevice.set("");
    }
}

/// What a client sent is looked at twice: what is wrong with it is logged twice.
void takeOverrides(const Settings& input, Settings& settings)
{
    for (int pass = 0; pass < 2; pass++)
        for (const auto rule : rules)
            rule(input, settings);
}

bool isFor(const Property<String>& id, const Property<String>& known)
{
    return !id.null && id.value == known.value;
}

} // namespace

std::optional<std::uint32_t> loopCount(std::string_view parameter)
{
    if (parameter.size() > loopDigits)
        return std::nullopt;
    std::uint32_t count = 0;
    std::from_chars(parameter.data(), parameter.data() + parameter.size(), count);
    return count >= 1 && count <= mostLoops ? std::optional(count) : std::nullopt;
}

std::optional<Array<std::uint8_t>> fitPattern(const Array<std::uint8_t>& pattern, std::uint32_t size)
{
    if (size == 0 || !std::all_of(pattern.begin(), pattern.end(), isHexDigit))
        return std::nullopt;
    constexpr std::uint8_t padding = '0';
    Array<std::uint8_t> fitted(pattern);
    fitted.resize(size, &padding);
    return fitted;
}

TVRHBA_JobSettingData* getDefaultTVRHBA_JobSettingDataInstance(InstanceCache& cache)
{
    return mapOf<TVRHBA_JobSettingData>(cache).first();
}

Settings* getDefaultTVRHBA_FCHBADiagnosticSettingDataInstance(InstanceCache& cache, std::string_view testName)
{
    Settings* found = mapOf<Settings>(cache).findFirst([&](const Settings& known)
                                                       { return known.InstanceID.value.view() == testName; });
    if (!found)
        TVR_LOG(TVR_DBG, "Could not find the default setting data");
    return found;
}

TVRHBA_JobSettingData* getTVRHBA_JobSettingDataInstance(InstanceCache& cache, const Instance* input)
{
    const auto* sent = cast<TVRHBA_JobSettingData>(input);
    TVRHBA_JobSettingData* settings = getDefaultTVRHBA_JobSettingDataInstance(cache);
    if (!sent || !settings || !isFor(sent->InstanceID, settings->InstanceID))
        return nullptr;
    usingOverrides.log();
    if (sent->DeleteOnCompletion.null)
        TVR_LOG(TVR_DBG, "Missing DeleteOnCompletion parameter, Valid values are 1 or 0. Using the default value");
    else
        settings->DeleteOnCompletion.set(sent->DeleteOnCompletion.value);
    return settings;
}

Settings* getTVRHBA_FCHBADiagnosticSettingDataInstance(InstanceCache& cache, const Instance* input,
                                                       std::string_view testName)
{
    Settings* settings = getDefaultTVRHBA_FCHBADiagnosticSettingDataInstance(cache, testName);
    const auto* sent = cast<Settings>(input);
    if (!sent)
    {
        TVR_LOG(TVR_DBG, "Invalid overrided Diagsetting param, default settings values are used");
        return nullptr;
    }
    const DiagnosticTest* test = findDiagnosticTest(testName);
    if (!test || !settings || !isFor(sent->InstanceID, settings->InstanceID))
        return nullptr;
    usingOverrides.log();
    if (test->settings == TestSettings::Fixed)
    {
        TVR_LOG(TVR_DBG, "No Override Setting Supported for test : %s", test->name);
        return settings;
    }
    if (test->hasBuffer())
        takeOverrides(*sent, *settings);
    settings->OverridedSettingData.set(1);
    if (test->settings == TestSettings::Targeted)
        takeTarget(*sent, *settings);
    return settings;
}

} // namespace cimple
