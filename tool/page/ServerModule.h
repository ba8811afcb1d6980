// The server of a page is in a module of its own: its library brings others with it, for which no other work of the
// command should wait.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

/// What is sent: bytes that are read in pieces.
class ServedBody {
public:
    virtual ~ServedBody() = default;
    virtual std::int64_t size() const = 0;
    /// The media type.
    virtual std::string type() const = 0;
    /// Bytes from `offset` on, at least one ahead of the end and at most as many as wanted; none if they cannot be
    /// read. One thread at a time.
    virtual std::string read(std::int64_t offset, std::size_t wanted) = 0;
};

struct ServedAnswer {
    int status = 200;
    std::shared_ptr<ServedBody> body; // null but for status 200
};

/// What a server is asked. Any thread may ask; nothing is thrown.
class ServedSite {
public:
    virtual ~ServedSite() = default;
    /// `path` is decoded; `host` is the header of that name.
    virtual ServedAnswer answer(const std::string& method, const std::string& path, const std::string& host) = 0;
    /// The headers of every answer: the name and the value of one after the other.
    virtual void eachHeader(const std::function<void(const char* name, const std::string& value)>& visit) const = 0;
};

struct ServerModule {
    static constexpr std::uint32_t currentVersion = 1;
    std::uint32_t version;
    /// Serves on 127.0.0.1 until the process ends. Port 0 is any that is free. `begin` is called with the port once it
    /// is open; false ends the server. Returns false if the port cannot be had.
    bool (*serve)(ServedSite& site, int port, const std::function<bool(int port)>& begin);
};

/// Null if it is not installed.
const ServerModule* serverModule();
