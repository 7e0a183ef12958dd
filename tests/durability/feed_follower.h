// A device that knows of an account by the change feed alone, and goes on where it stood when the
// server comes back.
#pragma once

#include <cstdint>
#include <string>

#include "emulator/random_changes.h"

class feed_follower {
public:
    explicit feed_follower(std::string session) : session_(std::move(session)) {}

    /** Asks until the feed has nothing more to tell. */
    void follow(std::uint16_t port);

    std::uint64_t revision() const { return revision_; }

    /** What of these entries the feed tells otherwise: their places, and the names of files. */
    std::string difference_to(const entries &expected) const;

private:
    void apply(const std::string &block);
    void update(const std::string &list, const std::string &kind, const std::string &key_element);
    void remove(const std::string &deleted);

    std::string session_;
    std::uint64_t revision_ = 0;
    entries known_;
};
