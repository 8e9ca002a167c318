#include "broker/tvrcim/ServeCommand.h"

#include "broker/cimxml/Port.h"
#include "broker/cimxml/SelfDescription.h"
#include "broker/http/Server.h"
#include "broker/metrics/Site.h"
#include "broker/tvrcim/SignalEnd.h"
#include "broker/web/Api.h"
#include "broker/web/Page.h"

#include <algorithm>
#include <charconv>
#include <iostream>
#include <iterator>
#include <ostream>

namespace tvrcim
{

namespace
{

/// "address:port", of which either part may be missing; an address of IPv6 stands in brackets.
void readListen(http::ServerOptions& options, const std::string& text)
{
    const std::size_t mark = text.rfind(':');
    const bool hasPort = mark != text.npos && text.find(']', mark) == text.npos;
    std::string address = hasPort ? text.substr(0, mark) : text;
    if (address.starts_with('[') && address.ends_with(']'))
        address = address.substr(1, address.size() - 2);
    if (!address.empty())
        options.address = address;
    if (!hasPort)
        return;
    constexpr int largestPort = 65535;
    const char* end = text.data() + text.size();
    const auto read = std::from_chars(text.data() + mark + 1, end, options.port);
    if (read.ec != std::errc() || read.ptr != end || options.port < 0 || options.port > largestPort)
        throw UsageError("--listen: '" + text.substr(mark + 1) + "' is no port");
}

http::ServerOptions optionsOf(const Session& session, const Command& command)
{
    http::ServerOptions options;
    options.changesWithoutUsers = session.simulated;
    readListen(options, command.listen);
    options.patience = std::chrono::seconds(command.patience);
    if (command.tls.size() == 2)
    {
        options.certificate = command.tls[0];
        options.key = command.tls[1];
    }
    if (!command.users.empty())
        options.users = http::Users(command.users);
    if (options.users.readByOthers())
        std::cerr << "tvrcim: warning: others may read the users' file '" << command.users << "'\n";
    return options;
}

/// What is at a path of its own comes before what takes all paths.
http::Site sitesOf(Session& session)
{
    http::Site site = web::pageSite();
    std::ranges::move(web::apiSite(session.broker, session.nameSpace, {TVRCIM_VERSION, session.simulated}),
                      std::back_inserter(site));
    std::ranges::move(metrics::site(session.broker, session.nameSpace), std::back_inserter(site));
    std::ranges::move(cimxml::site(session.broker), std::back_inserter(site));
    return site;
}

http::Server listen(Session& session, const http::ServerOptions& options)
{
    try
    {
        return http::Server(sitesOf(session), options);
    }
    catch (const http::CannotListen& error)
    {
        throw Unavailable(error.what());
    }
}

} // namespace

void serve(Session& session, const Command& command)
{
    using namespace std::chrono_literals;
    const http::ServerOptions options = optionsOf(session, command);
    cimxml::describePort(session.broker);
    const Interruptible interruptible(session.signals);
    const http::Server server = listen(session, options);
    const bool bracketed = options.address.find(':') != std::string::npos;
    session.out << "listening on " << (options.certificate.empty() ? "http" : "https") << "://"
                << (bracketed ? "[" + options.address + "]" : options.address) << ':' << server.port() << std::endl;
    while (session.signals && !session.signals->awaitInterrupt(1h))
        ;
}

} // namespace tvrcim
