#include "framework/GuardedWork.h"

#include <string>

#include "framework/Diagnostics.h"
#include "framework/HostServices.h"
#include "platform/KeyedUnarchiver.h"

namespace vexo {
namespace {

enum class Failure { brokenArchive, other };

Failure warnOf(std::exception_ptr failure) {
    Diagnostics& diagnostics = hostServices().diagnostics;
    try {
        std::rethrow_exception(failure);
    } catch (const platform::ArchiveError& error) {
        diagnostics.warn(error.what());
        return Failure::brokenArchive;
    } catch (const std::exception& error) {
        diagnostics.warn(std::string("a plug-in failed: ") + error.what());
    } catch (...) {
        diagnostics.warn("a plug-in failed for an unknown reason");
    }
    return Failure::other;
}

void warnOfBrokenArchive(const platform::ArchiveError& error, void* /*context*/) {
    hostServices().diagnostics.warn(error.what());
}

}  // namespace

bool runGuarded(const std::function<void()>& work) {
    try {
        work();
        return true;
    } catch (...) {
        return recoverFrom(std::current_exception(), work);
    }
}

bool runGuardedOnce(const std::function<void()>& work) {
    try {
        work();
        return true;
    } catch (...) {
        warnOf(std::current_exception());
        return false;
    }
}

bool recoverFrom(std::exception_ptr failure, const std::function<void()>& work) {
    if (warnOf(failure) != Failure::brokenArchive)
        return false;
    const platform::RejectedArchivesAsUnreadable tolerance(warnOfBrokenArchive, nullptr);
    return runGuardedOnce(work);
}

}  // namespace vexo
