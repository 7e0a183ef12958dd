// The real program, started as a user would start it.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include <sys/types.h>

#include "files.h"

/** The Content-Digest of the bytes "abc". */
inline const std::string abc_digest = "sha-256=:ungWv48Bz+pBQUDeXa4iI7ADYaOWF3qctBD/YfIAFa0=:";

/** A server process on ports of the kernel's choice. It has told that it listens when the
 * constructor returns, and is killed at the end unless it was stopped. */
class server_process {
public:
    explicit server_process(const std::filesystem::path &data,
                            const std::vector<std::string> &options = {});
    ~server_process();
    server_process(const server_process &) = delete;
    server_process &operator=(const server_process &) = delete;

    /** What it wrote to its ready descriptor. */
    const std::string &ready_line() const { return ready_line_; }
    std::uint16_t https_port() const { return port_after("\"https_port\": "); }
    std::uint16_t http_port() const { return port_after("\"http_port\": "); }
    /** Of a server that was started with "--admin". */
    std::uint16_t admin_port() const { return port_after("\"admin_port\": "); }
    std::filesystem::path root() const;
    pid_t id() const { return id_; }

    /** Sends the signal, waits for the end and returns the exit code, or -1 if a signal ended it.
     */
    int stop(int signal);

private:
    std::uint16_t port_after(const std::string &key) const;

    pid_t id_ = -1;
    std::string ready_line_;
};

/** The program with a pipe as its standard input, for as long as the test likes. */
class fed_process {
public:
    explicit fed_process(const std::vector<std::string> &arguments);
    ~fed_process();
    fed_process(const fed_process &) = delete;
    fed_process &operator=(const fed_process &) = delete;

    pid_t id() const { return id_; }
    /** Returns when all of it but what a pipe holds has been read. */
    void feed(const std::string &bytes);
    /** Kills it and waits for its end. */
    void kill();

private:
    pid_t id_ = -1;
    std::unique_ptr<emulator::descriptor> writing_;
};

struct finished_process {
    int exit_code; // -1 if a signal ended it
    std::string output;
    std::string errors;
};

/** Runs the program to its end with the text as its standard input. */
finished_process run_program(const std::vector<std::string> &arguments,
                             const std::string &input = {});

/** Adds ann@example.org, whose password is "secret", with further options of the command. Throws
 * what the program complains of. */
void add_ann(const std::string &data, const std::vector<std::string> &options = {});

/** A session of ann@example.org, whose password is "secret". */
std::string log_in(std::uint16_t port);
