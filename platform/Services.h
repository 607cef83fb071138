// The platform that the process runs on. The program that hosts us puts its services in place before it
// makes anything else and takes them away last; everything beneath finds them here, because the system's
// class operations have no other way to get at them. Tests put their own in place for the length of a test.
#pragma once

namespace platform {

class FileManager;
class Workspace;
class UserDefaults;
class Dispatcher;
class NotificationCenter;
class SystemLog;

struct Services {
    FileManager& fileManager;
    Workspace& workspace;
    UserDefaults& userDefaults;
    Dispatcher& dispatcher;
    NotificationCenter& notificationCenter;  // the process's default centre
    SystemLog& systemLog;
};

// Callable from any thread. Requires: a ServicesScope exists; std::logic_error is thrown where none does.
const Services& services();

// Puts services in place and, when it goes, the ones before it back. Not thread-safe: made and destroyed
// while no other thread uses services. Scopes nest: the one made last goes first.
class ServicesScope {
  public:
    explicit ServicesScope(const Services& services);
    ~ServicesScope();
    ServicesScope(const ServicesScope&) = delete;
    ServicesScope& operator=(const ServicesScope&) = delete;

  private:
    const Services services_;
    const Services* const previous_;
};

}  // namespace platform
