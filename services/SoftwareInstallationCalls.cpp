#include "services/SoftwareInstallationCalls.h"

#include "agent/Maps.h"
#include "agent/SoftwareVersion.h"
#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "device/ForeignText.h"
#include "device/TVR_MethodWrapper.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

#include <cerrno>
#include <string>
#include <sys/stat.h>

namespace cimple
{

namespace
{

bool isLocal(const HBA_WWN& wwpn)
{
    if (TVR_MethodWrapper::Validatewwpn(wwpn) == 0)
        return true;
    TVR_LOG(TVR_ERR, "INVALID wwpn");
    return false;
}

void logDownloadStatus(RM_STATUS status)
{
    switch (status)
    {
    case RM_OK:
        break;
    case RM_ERROR_MAILBOX_FAILED:
        TVR_LOG(TVR_DBG, "\nERROR: RM_DownloadFirmware: Mailbox failed; Internal Driver Error.\n");
        break;
    case RM_ERROR_MAILBOX_TIMEOUT:
        TVR_LOG(TVR_DBG, "\nERROR: RM_DownloadFirmware: Mailbox timed out.\n");
        break;
    case RM_ERROR_MAILBOX_BUSY:
        TVR_LOG(TVR_DBG, "\nERROR: RM_DownloadFirmware: Mailbox busy; retry.\n");
        break;
    default:
        TVR_LOG(TVR_DBG, "\nERROR: RM_DownloadFirmware: status = %d", status);
    }
}

/// The steps from the file to the flash memory, up to the one that fails.
RM_STATUS download(const HBA_WWN& wwpn, const char* file)
{
    RM_STATUS status = RM_ImportHBAFileA(file);
    TVR_LOG(TVR_DBG, "\n: RM_ImportHBAFile: status = %d", status);
    if (status != RM_OK)
        return status;
    const HBA_UINT8* b = wwpn.wwn;
    TVR_LOG(TVR_DBG, "wwpn %2x %2x %2x %2x %2x %2x %2x %2x", b[0], b[1], b[2], b[3], b[4], b[5], b[6], b[7]);
    status = RM_VerifyFirmwareA(0, 0, wwpn, file);
    TVR_LOG(TVR_DBG, "\n: RM_VerifyFirmware: status = %d", status);
    if (status != RM_OK)
        return status;
    TVR_LOG(TVR_DBG, "Starting Firmware download");
    status = LRM_DownloadFirmware(wwpn, file, 0);
    TVR_LOG(TVR_DBG, "Checking Firmware download status");
    logDownloadStatus(status);
    return status;
}

/// The identity of what is in the flash memory behind a port; null if the adapter told of none.
TVRHBA_SoftwareIdentity* firmwareOnFlash(ProviderAgent& agent, const String& port)
{
    return mapOf<TVRHBA_SoftwareIdentity>(agent).findFirst(
        [&](const TVRHBA_SoftwareIdentity& known)
        { return known.Name.value == "Firmware On Flash" && known.IdentityInfoValue.value.find(port) >= 0; });
}

} // namespace

bool isFileThere(const char* file, const LogText& notFound, const LogText& notReadable)
{
    struct stat status;
    if (stat(file, &status) != 0)
    {
        (errno == ENOENT ? notFound : notReadable).log();
        return false;
    }
    if (S_ISREG(status.st_mode))
        return true;
    notReadable.log();
    return false;
}

RM_STATUS tvrcimDownloadFW(const HBA_WWN& wwpn, const char* file)
{
    TVR_LOG(TVR_DBG, "entering the tvrcimDownloadFW function");
    if (!isLocal(wwpn) || !isFileThere(file, {TVR_ERR, "\nERROR: tvrcimDownloadFW: FW file not found"},
                                       {TVR_ERR, "\nERROR: tvrcimDownloadFW: Can't stat FW file"}))
        return RM_ERROR;
    const RM_STATUS status = download(wwpn, file);
    TVR_MethodWrapper::logStatus(status);
    return status;
}

void UpdateFirmwareOnFlash(ProviderAgent& agent, const HBA_WWN& wwpn)
{
    TVR_LOG(TVR_DBG, "Entering TVR_MethodWrapper::UpdateFirmwareOnFlash");
    AttributeBlock block(RM_HBA_ATTRIBUTES_SIZE);
    if (const RM_STATUS status = block.fetch(LRM_GetHBAAttributes, wwpn); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "ERROR: RM_GetHBAAttributes call failed (%d)", status);
        return;
    }
    std::string version;
    if (readText(block, RM_HA_FIRMWARE_ON_FLASH, "_FirmwareOnFlash", version) != RM_OK)
        return;
    if (TVRHBA_SoftwareIdentity* identity = firmwareOnFlash(agent, wwnText(wwpn)))
        setVersion(*identity, version);
}

RM_STATUS SetPortEnabled(const HBA_WWN& wwpn, std::uint32_t enabled, std::uint32_t& dynamic)
{
    TVR_LOG(TVR_DBG, "Entered SetPortEnabled %s %d", TVR_MethodWrapper::hbaNameToString(wwpn).c_str(), enabled);
    TVR_LOG(TVR_DBG, "Invoking RM_SetPortEnabled API ");
    const RM_STATUS status = LRM_SetPortEnabled(wwpn, enabled, &dynamic);
    TVR_LOG(TVR_DBG, " SetPortEnabled RM Status: %d", status);
    TVR_LOG(TVR_DBG, "Exiting SetPortEnabled function call. Dynamic value\t: %d", dynamic);
    return status;
}

RM_STATUS SetFECState(const HBA_WWN& wwpn, std::uint32_t enabled)
{
    const RM_STATUS status = LRM_SetAdapterAttribute(wwpn, RM_PA_FEC_STATE, &enabled, sizeof enabled);
    if (status != RM_OK)
        TVR_MethodWrapper::logStatus(status);
    return status;
}

} // namespace cimple
