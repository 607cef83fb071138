#include "core/ProcessCaches.h"

namespace reelix {

DefaultPathCache& defaultPathCache() {
    static DefaultPathCache cache;
    return cache;
}

IconCache& iconCache() {
    static IconCache cache;
    return cache;
}

}  // namespace reelix
