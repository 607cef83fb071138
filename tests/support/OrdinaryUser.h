// Runs a scope as a user whom permissions hold back, where the tests run as root.
#pragma once

#include <string>

namespace testing_support {

class OrdinaryUser {
  public:
    // Hands `folder`, though not what is in it, to that user.
    explicit OrdinaryUser(const std::string& folder);
    ~OrdinaryUser();
    OrdinaryUser(const OrdinaryUser&) = delete;
    OrdinaryUser& operator=(const OrdinaryUser&) = delete;

  private:
    const bool wasRoot_;
};

}  // namespace testing_support
