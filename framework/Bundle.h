// A plug-in bundle: a folder `Name.vxplugin` with Contents/{Info.plist, Linux/<module>, Resources/…}.
//
// The descriptor is read without loading the code. The code of a bundle that was loaded stays in the process.
#pragma once

#include <map>
#include <memory>
#include <string>

#include "framework/BundleStrings.h"
#include "host/VXPlugin.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class Bundle;
using BundleRef = std::shared_ptr<const Bundle>;

// Either a bundle or what is wrong with it.
struct BundleResult {
    BundleRef bundle;
    std::string error;
};

class Bundle final : public VXBundle {
  public:
    // Reads the descriptor. Refused: a folder that is no bundle, another interface version, and anything that
    // users other than its owner could have changed.
    static BundleResult open(const std::string& path);

    const std::string& path() const override { return path_; }
    const std::string& identifier() const override { return identifier_; }
    std::optional<std::string> localizedString(std::string_view key) const override;
    platform::ImageRef iconNamed(std::string_view name) const override VX_EXCLUDES(iconsMutex_);

    // What is wrong with its texts; empty when nothing is. The keys that are concerned have no text.
    const std::string& warning() const { return strings_.warning(); }

    // Loads the code, unless its file is no module for this process; nil when that fails, and `error` says
    // why. Callable from the main thread only.
    const VXPrincipalClass* principalClass(std::string& error) const;

  private:
    Bundle(std::string path, const platform::Dictionary& descriptor);

    std::string modulePath() const;
    std::shared_ptr<const platform::Picture> pictureOfIcon(const std::string& name) const
        VX_EXCLUDES(iconsMutex_);
    std::shared_ptr<const platform::Picture> knownPicture(const std::string& name) const
        VX_EXCLUDES(iconsMutex_);

    const std::string path_;
    const std::string identifier_;
    const std::string executable_;
    const std::string principalClassName_;
    const BundleStrings strings_;

    // What has been read. Whether it can be drawn is asked when an icon is wanted again; one that was missing
    // or damaged is then looked for again.
    mutable platform::Mutex iconsMutex_;
    mutable std::map<std::string, std::shared_ptr<const platform::Picture>> icons_ VX_GUARDED_BY(iconsMutex_);
};

}  // namespace vexo
