#include "tests/support/OrdinaryUser.h"

#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <system_error>

namespace testing_support {

namespace {

constexpr uid_t nobody = 65534;

}  // namespace

OrdinaryUser::OrdinaryUser(const std::string& folder) : wasRoot_(geteuid() == 0) {
    if (wasRoot_ && (chown(folder.c_str(), nobody, static_cast<gid_t>(-1)) != 0 || seteuid(nobody) != 0))
        throw std::system_error(errno, std::generic_category(), "cannot become another user");
}

OrdinaryUser::~OrdinaryUser() {
    // Whatever comes after would fail for reasons that nobody understands.
    if (wasRoot_ && seteuid(0) != 0)
        std::abort();
}

}  // namespace testing_support
