// A client that makes changes of every kind in an account of its own, one after another, and knows
// which of them were acknowledged.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include "emulator/random_changes.h"
#include "emulator/socket_client.h"

/** A change on its way: the request, and what is true once it is made. */
struct pending_write {
    std::string action;
    std::string parameters;
    std::function<void(entries &, const std::string &made)> effect;
    std::string key_element{}; // of the reply: the key of what was made; empty when nothing is
    std::string bytes{};       // of an upload
    std::string name{};        // of an upload of a new file, which is told it in the header
};

class writer {
public:
    /**
     * @param session of an account that nobody else changes
     * @param root    the key of its root
     * @param seed    the changes are chosen by it and by what is there already
     */
    writer(std::string session, std::string root, std::uint32_t seed);

    const std::string &session() const { return session_; }

    /** What the account must hold. */
    const entries &acknowledged() const { return acknowledged_; }

    /** What the service said when it refused a change, which it never should. */
    const std::string &refused() const { return refused_; }

    /** Makes changes until the connection is cut. Each acknowledgement is reported. */
    void write(std::uint16_t port, const std::function<void()> &report);

    /** How the change ended that was on its way when the connection was cut. */
    enum class end_of_pending { none, not_made, made };

    /**
     * Compares what the account holds with what it must hold. The change that was on its way may be
     * there, but then as a whole; it counts as acknowledged from then on.
     */
    end_of_pending settle(const entries &stored);

private:
    pending_write next_write();
    pending_write create_folder();
    pending_write create_file();
    pending_write upload_file();
    pending_write fill_file();
    pending_write revise_file();
    pending_write rename_file();
    pending_write rename_folder();
    pending_write move_file();
    pending_write move_folder();
    pending_write delete_file();
    pending_write delete_folder();

    /** Makes the pending change. Returns whether it was acknowledged; throws when the connection is
     * cut. */
    bool carry_out();
    std::string ask(const std::string &request);
    std::string request_of(const pending_write &write) const;

    std::uint32_t below(std::uint32_t end);
    std::vector<std::string> keys_with(const std::string &what, const std::string &value) const;
    std::string one_of(const std::vector<std::string> &keys);
    std::string file() { return one_of(keys_with("kind", "file")); }
    std::string folder() { return one_of(keys_with("kind", "folder")); }
    std::string folder_or_root();
    std::string new_name();
    std::string new_bytes();
    bool lies_within(std::string folder, const std::string &other) const;

    std::string session_;
    std::string root_;
    std::mt19937 random_;
    std::uint32_t names_ = 0;
    entries acknowledged_;
    std::optional<pending_write> pending_;
    std::optional<socket_client> connection_;
    std::string refused_;
};
