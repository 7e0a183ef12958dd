// The emulator's service with an account in it, made anew for every input and kept in memory but
// for the bytes of files.
#pragma once

#include <filesystem>
#include <set>
#include <string>

#include "emulator/scratch_directory.h"
#include "service.h"
#include "store/content.h"
#include "store/database.h"
#include "support/reference_document.h"
#include "support/target.h"

namespace quillmere_fuzz {

// For requests, which go through a database.
constexpr budget served = {0.5, 2e-5, 16 << 20, 512};

class emulated_service {
public:
    emulated_service();
    ~emulated_service();

    // Keys and tokens are random, so an input names them: {T} is a session token, {F} the key of a
    // folder, {Q} that of a file in it, {H} the hash of no bytes.
    std::string filled_in(std::string text) const;

    // An operation of the account, which must succeed.
    document done(const std::string &action, const std::string &parameters);

    emulator::service &state() { return state_; }
    size_t stored_files() const;
    uint64_t revision();

private:
    emulator::database store_{":memory:"};
    emulator::content_store content_;
    emulator::service state_;
    std::int64_t account_ = 0;
    std::string token_;
    std::string folder_;
    std::string file_;
};

// A reply is always a whole envelope, whose result goes with its status, and never says that the
// service itself has failed.
void expect_envelope(const emulator::reply &made, const std::string &success = "Success");

} // namespace quillmere_fuzz
