// The module that serves a page over HTTP, by cpp-httplib. What may be asked, and what is answered, is the site's
// business.
#include "platform/core/Export.h"
#include "tool/page/ServerModule.h"
#include "tool/page/server/ServingThreads.h"

#include <httplib.h>

#include <algorithm>
#include <exception>
#include <memory>
#include <string>

namespace {

constexpr const char* kHost = "127.0.0.1";
constexpr int kNotSatisfiable = 416;
// A browser opens six connections to a host, and each keeps a thread.
constexpr std::size_t kThreads = 32;
constexpr std::size_t kPieceSize = 64 * 1024;

// Holds the range that is asked for against the size. Several ranges are answered with all; false if none of the body
// is in the range. Kept: the server library gives requests out as constant, and applies their ranges after this as they
// are, without a look at the size.
bool settleRange(const httplib::Request& request, std::int64_t size)
{
    auto& ranges = const_cast<httplib::Request&>(request).ranges;
    if (ranges.size() != 1 || size == 0) {
        ranges.clear();
        return true;
    }
    auto& [first, last] = ranges.front();
    if (first < 0) { // the last ones
        const bool hasAny = last > 0;
        first = std::max<std::int64_t>(0, size - std::max<std::int64_t>(last, 0));
        last = size - 1;
        if (!hasAny)
            ranges.clear();
        return hasAny;
    }
    if (last < 0 || last >= size)
        last = size - 1;
    if (first <= last)
        return true;
    ranges.clear();
    return false;
}

void send(const httplib::Request& request, httplib::Response& response, const std::shared_ptr<ServedBody>& body)
{
    const std::int64_t size = body->size();
    response.set_header("Accept-Ranges", "bytes");
    if (!settleRange(request, size)) {
        response.status = kNotSatisfiable;
        response.set_header("Content-Range", "bytes */" + std::to_string(size));
        return;
    }
    // Given as a provider, it is not compressed, which would take longer than the way within the machine.
    if (size > 0)
        response.set_content_provider(
            static_cast<std::size_t>(size), body->type(),
            [body](std::size_t offset, std::size_t length, httplib::DataSink& sink) {
                try {
                    const std::string piece =
                        body->read(static_cast<std::int64_t>(offset), std::min(length, kPieceSize));
                    return !piece.empty() && sink.write(piece.data(), piece.size());
                } catch (const std::exception&) { // for want of memory; it must not reach the thread of the server
                    return false;
                }
            });
    else
        response.set_content("", body->type());
}

bool serve(ServedSite& site, int port, const std::function<bool(int)>& begin)
{
    auto threads = std::make_unique<ServingThreads>(kThreads);
    httplib::Server server;
    server.new_task_queue = [&threads] { return threads.release(); }; // the server owns them
    // The default would let another process of the same user open the same port.
    server.set_socket_options([](socket_t socket) {
        const int yes = 1;
        ::setsockopt(socket, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
    });
    server.set_tcp_nodelay(true);
    server.set_keep_alive_max_count(1000);
    server.set_pre_routing_handler([&site](const httplib::Request& request, httplib::Response& response) {
        site.eachHeader([&](const char* name, const std::string& value) { response.set_header(name, value); });
        const ServedAnswer answer = site.answer(request.method, request.path, request.get_header_value("Host"));
        response.status = answer.status;
        if (answer.body) {
            response.status = -1; // 200, or 206 for a range
            send(request, response, answer.body);
        }
        return httplib::Server::HandlerResponse::Handled;
    });
    if (port == 0)
        port = std::max(server.bind_to_any_port(kHost), 0);
    else if (!server.bind_to_port(kHost, port))
        return false;
    if (port == 0)
        return false;
    return !begin(port) || server.listen_after_bind();
}

} // namespace

extern "C" KT_EXPORT const ServerModule ktfiles_serverModule = {ServerModule::currentVersion, serve};
