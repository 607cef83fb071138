#include "platform/linux/LinuxSystemLog.h"

#include <syslog.h>

#include <cstdio>

#include "platform/linux/LogText.h"

namespace platform {

LinuxSystemLog::LinuxSystemLog(std::string identity, StandardError standardError)
    : identity_(std::move(identity)), standardError_(standardError) {
    openlog(identity_.c_str(), LOG_PID, LOG_USER);
}

LinuxSystemLog::~LinuxSystemLog() {
    closelog();
}

void LinuxSystemLog::log(std::string_view line) {
    const std::string text = printable(line);
    syslog(LOG_NOTICE, "%s", text.c_str());
    if (standardError_ == StandardError::copies)
        std::fputs((identity_ + ": " + text + "\n").c_str(), stderr);
}

}  // namespace platform
