// The plainest of clients: sends bytes and reads bytes, so that a test sees exactly what went over
// the wire.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>

#include "files.h"

class socket_client {
public:
    /** Connects to 127.0.0.1, or to ::1. Throws when refused. */
    explicit socket_client(std::uint16_t port, bool ipv6 = false);

    void send(const std::string &bytes);
    /** Sends no more; the server sees the end. */
    void finish();
    /** Reads until the text has arrived or the connection is over; returns what came so far. */
    std::string read_until(const std::string &text);
    /** Reads one reply with its body, whose length its header must state. */
    std::string read_reply();
    /** Reads until the server closes. */
    std::string read_to_end();
    /** Whether nothing has come, not even an end, that was not read. */
    bool is_silent() const;
    /** Whether the connection was over because the server tore it down. */
    bool was_reset() const { return was_reset_; }

private:
    bool read_piece();

    emulator::descriptor socket_;
    std::string received_;
    bool was_reset_ = false;
};

/** One GET over HTTP on a connection of its own; the whole reply. */
std::string get(std::uint16_t port, const std::string &target);

/** The same of any method and body. */
std::string ask(std::uint16_t port, const std::string &method, const std::string &target,
                const std::string &body = {});

/**
 * One GET over HTTPS with the peer verified against the root and the name. Throws what the
 * certificate lacks when it does not hold.
 */
std::string get_verified(std::uint16_t port, const std::string &target,
                         const std::filesystem::path &root, const std::string &name);

/** The same of a whole request, which must ask the server to close. */
std::string ask_verified(std::uint16_t port, const std::string &request,
                         const std::filesystem::path &root, const std::string &name);

/** The text of the first element of this name, or an empty text. */
std::string element(const std::string &reply, const std::string &name);
