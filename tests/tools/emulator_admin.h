// Has the local service fail on demand, and tells how often it did.
#pragma once

#include <cstdint>
#include <string>

#include <nlohmann/json.hpp>

namespace quillmere_test {

class emulator_admin {
public:
    /** @param url where the emulator's ready line says that its admin address is */
    explicit emulator_admin(const std::string &url);

    /** Places a fault, and gives its number. */
    int place(const nlohmann::json &fault) const;

    /** Such as "3 seen, 2 fired". */
    std::string counts_of(int fault) const;

private:
    nlohmann::json ask(const std::string &method, const std::string &path,
                       const std::string &body = {}) const;

    std::uint16_t port_;
};

} // namespace quillmere_test
