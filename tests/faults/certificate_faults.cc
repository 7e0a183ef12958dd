// Certificates that are not to be trusted, with something to check them against and without.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

const std::vector<wire> encrypted = {wire::https};

fault shown(const std::string &name, std::function<certificate()> make, expectation expected)
{
    return fault{name, {answering(xml_reply(good_body))}, std::move(expected)}
        .over(encrypted)
        .showing(std::move(make));
}

certificate self_signed() { return self_signed_certificate(); }

} // namespace

std::vector<fault> certificate_faults()
{
    struct kind {
        std::string name;
        certificate (*make)();
        bool wrong_host;
    };
    const kind kinds[] = {
        {"expired certificate", expired_certificate, false},
        {"certificate of tomorrow", not_yet_valid_certificate, false},
        {"certificate for another host", certificate_for_another_host, true},
        {"certificate of an unknown root", certificate_of_unknown_root, false},
        {"self signed certificate", self_signed, false},
    };
    const expectation refused = fails({CURLE_PEER_FAILED_VERIFICATION}).seen(0, 1);

    std::vector<fault> rows;
    for (const kind &each : kinds) {
        rows.push_back(shown(each.name, each.make, refused));
        // Without a root to check against, the name is all that is checked.
        rows.push_back(
            shown(each.name + " and no CA", each.make, each.wrong_host ? refused : succeeds())
                .trusting(trust::nothing));
        rows.push_back(shown(each.name + " and no verification", each.make, succeeds())
                           .trusting(trust::anything));
    }
    rows.push_back(
        shown("missing CA file", loopback_certificate, fails({CURLE_SSL_CACERT_BADFILE}).seen(0, 1))
            .trusting(trust::missing_file));
    return rows;
}

} // namespace quillmere_test
