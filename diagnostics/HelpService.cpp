#include "diagnostics/HelpService.h"

#include "agent/MethodCall.h"

namespace cimple
{

namespace
{

constexpr std::uint32_t invalid = 5;
constexpr std::uint16_t asString = 1; ///< "Other" of both value maps, described as "String"

constexpr ServiceTexts texts = {
    .wrongService = {TVR_DBG, "Invalid instance of Help Service"},
    .ofService = {invalid},
};

/// The first element; empty if there is none.
String firstText(const Property<Array<String>>& texts)
{
    return texts.null || texts.value.size() == 0 ? String() : texts.value[0];
}

std::uint32_t getHelp(const Instance* reference, CIM_HelpService_GetHelp_method& parameters)
{
    MethodCall call({TVR_DBG, "TVRHBA_HelpService_Provider::GetHelp"});
    const auto* help = call.self<TVRHBA_HelpService>(reference, texts);
    if (parameters.RequestedDocument.null || parameters.Format.null || parameters.RequestedDelivery.null)
        MethodCall::end({TVR_DBG, "Invalid Requested Document"}, {invalid});
    if (firstText(help->DocumentsAvailable) != parameters.RequestedDocument.value)
        return methodFailed;
    if (parameters.RequestedDelivery.value != asString || parameters.Format.value != asString)
        MethodCall::end({TVR_DBG, "Unsupported Delivery options, Use '1' for proper support"}, {invalid});
    parameters.DocumentInfo.set(firstText(help->DocumentDescriptions));
    return 0;
}

} // namespace

std::span<const MethodRow> helpServiceMethods()
{
    return methodTable<TVRHBA_HelpService, &getHelp>;
}

} // namespace cimple
