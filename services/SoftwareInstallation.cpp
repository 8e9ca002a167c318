#include "services/SoftwareInstallation.h"

#include "agent/Build.h"
#include "agent/MethodCall.h"
#include "device/CurlTransfer.h"
#include "foundation/File.h"
#include "schema/TVRHBA_FCPort.h"
#include "services/SoftwareInstallationCalls.h"

#include <algorithm>
#include <string>
#include <string_view>
#include <unistd.h>
#include <utility>
#include <vector>

namespace cimple
{

namespace
{

using Service = TVRHBA_SoftwareInstallationService;
using ByteStream = CIM_SoftwareInstallationService_InstallFromByteStream_method;
using FromURI = CIM_SoftwareInstallationService_InstallFromURI_method;
using ResetHBA = TVRHBA_SoftwareInstallationService_ResetHBA_method;
using PortEnabled = TVRHBA_SoftwareInstallationService_SetPortEnabled_method;
using HBAFeatures = TVRHBA_SoftwareInstallationService_GetHBAFeatures_method;
using FECState = TVRHBA_SoftwareInstallationService_SetFECState_method;
using Options = Array<std::uint16_t>;

constexpr MethodEnd notSaved = {4};
constexpr MethodEnd invalid = {5};

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of Software Installation Service"},
    .noTarget = {TVR_ERR, "Target has a null pointer"},
    .unknownTarget = {TVR_ERR, "TVRHBA_SoftwareInstallationService_Provider::Wrong DeviceID passed"},
    .noPlainName = {TVR_DBG, "TVRHBA_SoftwareInstallationService_Provider::Id2HBAName failed"},
    .noWwn = {TVR_DBG, "TVRHBA_SoftwareInstallationService_Provider::str2HBAName failed"},
    .ofService = invalid,
    .ofTarget = invalid,
    .ofName = invalid,
};

ServiceTexts fecTexts()
{
    ServiceTexts own = texts;
    own.noTarget = {TVR_DBG, "Target Port is NULL"};
    own.unknownTarget = {TVR_DBG, "Invalid Port is passed, Cannot Enable/Disable FEC"};
    return own;
}

/// The DeviceID of the port that a method is to work on.
String targetOf(MethodCall& call, const Instance* reference, const ServiceTexts& with = texts)
{
    return call.target<TVRHBA_FCPort>(reference, with).DeviceID.value;
}

// --- install options

constexpr std::uint16_t resetAfterwards = 2;
constexpr std::uint16_t namesTheFile = 32768; ///< by its value, of byte streams alone

/// The others have no effect of their own.
constexpr std::uint16_t uriOptions[] = {resetAfterwards, 4, 5, 6, 7, 11};
constexpr std::uint16_t byteStreamOptions[] = {resetAfterwards, 4, 5, 6, 7, 11, namesTheFile};

/// Those that the client gave, if all are among the known ones.
template <class Known> Options checkedOptions(const Property<Options>& given, const Known& known)
{
    const Options options = given.null ? Options() : given.value;
    TVR_LOG(TVR_DBG, "size of InstallOptions array = %d, first member %u", static_cast<int>(options.size()),
            options.size() ? options[0] : 0u);
    for (const std::uint16_t option : options)
        if (std::ranges::find(known, option) == std::end(known))
            MethodCall::end({TVR_ERR, "invalid value of Install options"}, invalid);
    return options;
}

// --- from the file to the adapter

/// What both ways of installation have in common from the file on.
struct Installation
{
    const Service& service;
    const String& target;
    const std::string& file;
    const Options& options;
    void (*done)(ProviderAgent& agent, const Installation& installation, const HBA_WWN& wwpn);
};

void removeInstalled(const std::string& file)
{
    if (unlink(file.c_str()) == 0)
        TVR_LOG(TVR_DBG, "tvrcimDownloadFW: FW file %s removed successfully", file.c_str());
    else
        TVR_LOG(TVR_DBG, "tvrcimDownloadFW: Can't stat file %s", file.c_str());
}

/// Once, however often the client asks.
RM_STATUS resetWhereAsked(const HBA_WWN& wwpn, const Options& options)
{
    if (std::ranges::find(options, resetAfterwards) == options.end())
        return RM_OK;
    TVR_LOG(TVR_DBG, "HBA RESET OPTION SELECTED");
    const RM_STATUS status = TVR_MethodWrapper::tvrcimReset(wwpn);
    TVR_LOG(TVR_DBG, status == RM_OK ? "Fiwmware download functionality complete with Reset on the HBA"
                                     : "TVRHBA_SoftwareInstallationService_Provider::tvrcimResetHBA failed");
    return status;
}

std::uint32_t install(MethodCall& call, const Installation& installation)
{
    const HBA_WWN wwpn = call.wwpn(installation.target, texts);
    if (installation.service.Name.value != "TVRHBA_FCSoftwareInstallationService")
        MethodCall::end({TVR_DBG, "Error - The SoftwareInstallationService instance selected is incorrect "}, invalid);
    RM_STATUS status = tvrcimDownloadFW(wwpn, installation.file.c_str());
    call.refreshAfterwards();
    if (status == RM_OK)
    {
        installation.done(call.agent(), installation, wwpn);
        status = resetWhereAsked(wwpn, installation.options);
    }
    else // the file stays, and no reset would help: also of firmware that none activates (RM_ERROR_NO_RESET)
        TVR_LOG(TVR_ERR, "Error - in the firmware download functionality");
    return static_cast<std::uint32_t>(status);
}

// --- from a byte stream

/// What the image is without the length that may stand before it, which counts itself.
std::string_view withoutLength(const Array<std::uint8_t>& image)
{
    constexpr std::size_t prefix = 4;
    const std::string_view bytes(reinterpret_cast<const char*>(image.data()), image.size());
    std::size_t length = 0;
    for (std::size_t i = 0; i < std::min(prefix, image.size()); i++)
        length = length << 8 | image[i];
    return image.size() >= prefix && length == image.size() ? bytes.substr(prefix) : bytes;
}

/// The value of the option that names the file; empty where the client gave none.
std::string givenFileName(const Options& options, const Property<Array<String>>& values)
{
    const auto place = std::ranges::find(options, namesTheFile);
    if (place == options.end())
        MethodCall::end({TVR_ERR, "InstallOptions does not have the value 32768"}, invalid);
    const auto index = static_cast<std::size_t>(place - options.begin());
    const std::string name(values.null || index >= values.value.size() ? "" : values.value[index].c_str());
    TVR_LOG(TVR_DBG, "filename is : %s", name.c_str());
    return name;
}

void save(std::string_view image, const std::string& name)
{
    File_Descriptor file = createNamedFile(name);
    if (!file)
        MethodCall::end({TVR_ERR, "Could not open file to copy the firmware from ByteStream"}, notSaved);
    if (!write_all(file.get(), image.data(), image.size()) || !file.close())
    {
        unlink(name.c_str());
        MethodCall::end({TVR_ERR, "Could not copy the firmware from ByteStream"}, notSaved);
    }
    if (!isFileThere(name.c_str(), {TVR_ERR, "ERROR: tvrcimDownloadFW: FW file not found"},
                     {TVR_ERR, "ERROR: tvrcimDownloadFW: Can't stat FW file "}))
        MethodCall::end({}, notSaved);
}

std::uint32_t installFromByteStream(const Instance* reference, ByteStream& parameters)
{
    MethodCall call({TVR_DBG, "Entering InstallFromByteStream"});
    const Service& service = *call.self<Service>(reference, texts);
    const String target = targetOf(call, parameters.Target);
    const Options options = checkedOptions(parameters.InstallOptions, byteStreamOptions);
    const std::string file = givenFileName(options, parameters.InstallOptionsValues);
    if (parameters.Image.null)
        MethodCall::end({TVR_ERR, "Image has a null pointer"}, invalid);
    save(withoutLength(parameters.Image.value), file);
    const auto done = [](ProviderAgent&, const Installation& installation, const HBA_WWN&)
    {
        removeInstalled(installation.file);
        TVR_LOG(TVR_WARN, "FC download functionality complete for target %s", installation.target.c_str());
    };
    return install(call, {service, target, file, options, done});
}

// --- from a URI

std::uint32_t installFromURI(const Instance* reference, FromURI& parameters)
{
    MethodCall call({TVR_DBG, "entering InstallFromURI"});
    const std::string uri(parameters.URI.null ? "" : parameters.URI.value.c_str());
    if (uri.empty())
        MethodCall::end({TVR_DBG, "Null sized URI..returning"}, invalid);
    const Ref<Service> service(clone_of(call.self<Service>(reference, texts))); // outlives what the cache has of it
    const String target = targetOf(call, parameters.Target);
    const Options options = checkedOptions(parameters.InstallOptions, uriOptions);
    std::string file;
    const int fetched = call.withoutLock([&] { return downloadFileUsingCurl(uri, file); });
    if (fetched != 0)
    {
        TVR_LOG(TVR_DBG, "ERROR: CURL returned with Error :%d", fetched);
        return static_cast<std::uint32_t>(fetched);
    }
    const auto done = [](ProviderAgent& agent, const Installation& installation, const HBA_WWN& wwpn)
    {
        TVR_LOG(TVR_DBG, "FC Firmware download completed for target %s Please reboot system to activate new firmware.",
                installation.target.c_str());
        // Without memory for it, the refresh that is due shows the new version.
        unlessOutOfMemory([&] { return UpdateFirmwareOnFlash(agent, wwpn), true; });
        removeInstalled(installation.file);
    };
    return install(call, {*service, target, file, options, done});
}

// --- commands to a port

std::uint32_t resetHBA(const Instance* reference, ResetHBA& parameters)
{
    MethodCall call({TVR_DBG, "Entering ResetHBA"});
    const auto* named = cast<Service>(reference);
    if (named && named->Name.value == "TVRUCNA_SoftwareInstallationService")
        MethodCall::end({TVR_ERR, "Reset HBA on CNA is not supported"}, invalid);
    call.self<Service>(reference, texts);
    const String target = targetOf(call, parameters.Target);
    const RM_STATUS status = TVR_MethodWrapper::tvrcimReset(call.wwpn(target, texts));
    if (status == RM_OK)
    {
        TVR_LOG(TVR_WARN,
                "TVRHBA_SoftwareInstallationService_Provider::tvrcimResetHBA for target %s is Successful.. Updating "
                "the Provider Data",
                target.c_str());
        call.refreshAfterwards();
    }
    else
        TVR_LOG(TVR_ERR, "TVRHBA_SoftwareInstallationService_Provider::tvrcimResetHBA failed for target %s",
                target.c_str());
    return static_cast<std::uint32_t>(status);
}

std::uint32_t setPortEnabled(const Instance* reference, PortEnabled& parameters)
{
    TVR_LOG(TVR_DBG, "Input PortEnable : %d", parameters.PortEnabled.value);
    MethodCall call({});
    call.self<Service>(reference, texts);
    const String target = targetOf(call, parameters.Target);
    if (parameters.PortEnabled.null)
        MethodCall::end({}, invalid);
    std::uint32_t dynamic = 0;
    const RM_STATUS status = SetPortEnabled(call.wwpn(target, texts), parameters.PortEnabled.value, dynamic);
    if (status == RM_OK)
    {
        parameters.ConfigStatus.set(dynamic);
        TVR_LOG(TVR_DBG, "TVRHBA_SoftwareInstallationService_Provider::SetPortEnabled for target %s is Successful. ",
                target.c_str());
    }
    else
        TVR_LOG(TVR_DBG, "TVRHBA_SoftwareInstallationService_Provider::SetPortEnabled failed for target %s",
                target.c_str());
    return static_cast<std::uint32_t>(status);
}

std::uint32_t getHBAFeatures(const Instance* reference, HBAFeatures& parameters)
{
    MethodCall call({TVR_DBG, "Entering TVRHBA_SoftwareInstallationService_Provider::GetHBAFeatures"});
    call.self<Service>(reference, texts);
    const String target = targetOf(call, parameters.Target);
    std::vector<RM_Feature> features;
    const RM_STATUS status = TVR_MethodWrapper::GetHBAFeatureList(call.wwpn(target, texts), &features);
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "TVRHBA_SoftwareInstallationService_Provider::GetHBAFeatureList failed for target %s",
                target.c_str());
        return static_cast<std::uint32_t>(status);
    }
    Array<String> shown;
    for (const RM_Feature& feature : features)
        shown.append(formatText("%u->%u", feature.tag, feature.value));
    parameters.Features.set(std::move(shown));
    return 0;
}

std::uint32_t setFECState(const Instance* reference, FECState& parameters)
{
    TVR_LOG(TVR_DBG, "Input FEC Flag : %d", parameters.EnableFlag.value);
    MethodCall call({});
    call.self<Service>(reference, texts);
    const String target = targetOf(call, parameters.Target, fecTexts());
    if (parameters.EnableFlag.null)
        MethodCall::end({}, invalid);
    const RM_STATUS status = SetFECState(call.wwpn(target, texts), parameters.EnableFlag.value);
    TVR_LOG(TVR_DBG,
            status == RM_OK
                ? "TVRHBA_SoftwareInstallationService_Provider::SetFECPortState for target %s is Successful. "
                : "TVRHBA_SoftwareInstallationService_Provider::SetFECPortState failed for target %s",
            target.c_str());
    return static_cast<std::uint32_t>(status);
}

} // namespace

std::span<const MethodRow> softwareInstallationMethods()
{
    return methodTable<Service, &installFromByteStream, &installFromURI, &resetHBA, &setPortEnabled, &getHBAFeatures,
                       &setFECState>;
}

} // namespace cimple
