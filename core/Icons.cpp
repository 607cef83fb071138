#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "platform/Services.h"
#include "platform/Workspace.h"

namespace reelix {
namespace {

using platform::ImageRef;

constexpr platform::Size smallIconSize{16, 16};

ImageRef copyOf(const ImageRef& image) {
    return image ? image->copy() : nullptr;
}

ImageRef scaledSmall(ImageRef image) {
    if (image) {
        image->setScalesWhenResized(true);
        image->setSize(smallIconSize);
    }
    return image;
}

bool isMissingOrInvalid(const IconSlot& slot) {
    const ImageRef image = slot.get();
    return !image || !image->isValid();
}

}  // namespace

// Slots of images that can no longer be drawn are filled again, so a new plug-in object repairs icons that
// failed to load before; the two small icons are filled once.
void VXReelixPlugin::_grabReelixIcons() {
    IconCache& icons = iconCache();
    if (!icons.smallApplicationIcon.get())
        icons.smallApplicationIcon.set(scaledSmall(copyOf(rootMediaGroupIcon())));
    if (!icons.smallApplicationIcon.get())
        icons.smallApplicationIcon.set(copyOf(iconNamed(MBReelixAppIconSmall)));

    const std::pair<IconSlot*, std::string_view> named[] = {
        {&icons.calendarIcon, Reelix_icon_calendar},
        {&icons.eventIcon, Reelix_icon_event},
        {&icons.projectIcon, Reelix_icon_project},
        {&icons.trailerIcon, Reelix_icon_trailer},
    };
    for (const auto& [slot, name] : named) {
        if (isMissingOrInvalid(*slot))
            slot->set(copyOf(iconNamed(name)));
    }
    if (!icons.reelixIcon.get())
        icons.reelixIcon.set(scaledSmall(copyOf(iconNamed(MBReelixIcon))));

    if (isMissingOrInvalid(icons.spareProjectIcon))
        icons.spareProjectIcon.set(copyOf(icons.projectIcon.get()));
    if (isMissingOrInvalid(icons.spareTrailerIcon))
        icons.spareTrailerIcon.set(copyOf(icons.trailerIcon.get()));
}

platform::ImageRef VXReelixPlugin::rootMediaGroupIcon() {
    platform::Locked lock(*_appIconLock);
    if (_appIcon)
        return _appIcon;

    platform::Workspace& workspace = platform::services().workspace;
    const auto application = workspace.applicationForCreator(ReelixApplicationCreatorCode);
    ImageRef icon;
    if (application && application->url)
        icon = workspace.iconForApplication(*application);
    if (!icon)
        icon = iconNamed(MBReelixAppIconSmall);
    _appIcon = scaledSmall(icon);
    return _appIcon;
}

}  // namespace reelix
