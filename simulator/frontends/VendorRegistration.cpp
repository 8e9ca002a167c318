// The simulated host as a vendor library under the HBA API's common library.
#include "simulator/frontends/FrontEnd.h"

#include <vendorhbaapi.h>

namespace
{

/// The common library may load a vendor library again without freeing it, and counts a failure as no library.
HBA_STATUS loadVendorLibrary()
{
    HBA_LoadLibrary();
    return HBA_STATUS_OK;
}

} // namespace

extern "C" TVRSIM_EXPORT HBA_STATUS HBA_RegisterLibraryV2(HBA_ENTRYPOINTSV2* table)
{
    table->GetVersionHandler = HBA_GetVersion;
    table->LoadLibraryHandler = loadVendorLibrary;
    table->FreeLibraryHandler = HBA_FreeLibrary;
    table->GetNumberOfAdaptersHandler = HBA_GetNumberOfAdapters;
    table->GetAdapterNameHandler = HBA_GetAdapterName;
    table->OpenAdapterHandler = HBA_OpenAdapter;
    table->CloseAdapterHandler = HBA_CloseAdapter;
    table->GetAdapterAttributesHandler = HBA_GetAdapterAttributes;
    table->GetAdapterPortAttributesHandler = HBA_GetAdapterPortAttributes;
    table->RefreshInformationHandler = HBA_RefreshInformation;
    table->GetFcpTargetMappingHandler = HBA_GetFcpTargetMapping;
    table->ScsiInquiryHandler = HBA_SendScsiInquiry;
    table->ReadCapacityHandler = HBA_SendReadCapacity;
    return HBA_STATUS_OK;
}
