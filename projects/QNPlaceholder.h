// Stands in for objects of classes that only the editor has. Knows nothing of what it stands for.
#pragma once

#include "platform/KeyedUnarchiver.h"

namespace reelix {

class QNPlaceholder final : public platform::ArchivedObject {
  public:
    // initWithCoder:; the coder is not looked at.
    static platform::ArchivedObjectRef initWithCoder(platform::KeyedUnarchiver& coder);

    std::string description() const override { return "QN_PLACEHOLDER"; }
};

}  // namespace reelix
