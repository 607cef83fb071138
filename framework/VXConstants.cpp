#include "host/VXConstants.h"

namespace vexo {

const VXGroupTypeIdentifier VXReelixRootGroupTypeIdentifier{"VXReelixRootGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixProjectGroupTypeIdentifier{"VXReelixProjectGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixProjectLibraryGroupTypeIdentifier{
    "VXReelixProjectLibraryGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixFolderGroupTypeIdentifier{"VXReelixFolderGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixOldReelixProjectsGroupTypeIdentifier{
    "VXReelixOldReelixProjectsGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixEventLibraryGroupTypeIdentifier{
    "VXReelixEventLibraryGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixEventCalendarGroupTypeIdentifier{
    "VXReelixEventCalendarGroupTypeIdentifier"};
const VXGroupTypeIdentifier VXReelixEventGroupTypeIdentifier{"VXReelixEventGroupTypeIdentifier"};

}  // namespace vexo
