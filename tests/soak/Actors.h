// Those who act in a soak. `places` and `host` outlive them.
#pragma once

#include <memory>

#include "framework/Host.h"
#include "tests/soak/Actor.h"
#include "tests/soak/Places.h"

namespace soak {

using ActorRef = std::unique_ptr<Actor>;

// --- With files, each on any thread
// --------------------------------------------------------------------------

// Writes, cuts, renames, dates and deletes clips.
ActorRef newClipEditor(const Places& places, unsigned seed);
// Makes, renames and deletes events, and moves them in and out whole.
ActorRef newEventMover(const Places& places, unsigned seed);
// Makes, changes, moves and deletes projects with their movies and documents.
ActorRef newProjectEditor(const Places& places, unsigned seed);
// Puts links, pipes and other things where clips and folders are expected.
ActorRef newLinkMaker(const Places& places, unsigned seed);
// Hides things and shows them again.
ActorRef newHider(const Places& places, unsigned seed);
// Takes permissions away and gives them back.
ActorRef newPermissionChanger(const Places& places, unsigned seed);
// Takes whole libraries away and brings them back.
ActorRef newLibraryMover(const Places& places, unsigned seed);
// Changes the order of events, with broken preferences between.
ActorRef newPreferenceChanger(const Places& places, unsigned seed);
// Puts a disk with events in and takes it out. Requires: the process may mount file systems.
ActorRef newDiskUser(const Places& places, unsigned seed);
// Mounts folders and file systems over parts of libraries. Requires: the process may mount.
ActorRef newFolderCoverer(const Places& places, unsigned seed);
// Runs other programs on the same libraries, index and caches, some of which it kills.
ActorRef newOtherProgram(const Places& places, unsigned seed);

// --- With the host's tree, each on any thread
// ----------------------------------------------------------------

// Reads trees from end to end.
ActorRef newTreeReader(vexo::Host& host, unsigned seed);
// Asks for properties of items.
ActorRef newPropertyAsker(vexo::Host& host, unsigned seed);
// Draws thumbnails and icons.
ActorRef newThumbnailDrawer(vexo::Host& host, unsigned seed);
// Watches paths, queries and trees for a moment.
ActorRef newPassingObserver(vexo::Host& host, const Places& places, unsigned seed);

// --- With the host, on the main thread
// -----------------------------------------------------------------------

// Opens menus without choosing from them, and asks what to say of empty groups.
ActorRef newMenuOpener(vexo::Host& host, unsigned seed);
// Copies items and groups.
ActorRef newCopier(vexo::Host& host, unsigned seed);
// Asks for overlays and draws them.
ActorRef newOverlayDrawer(vexo::Host& host, unsigned seed);
// Loads, and cancels loads.
ActorRef newLoader(vexo::Host& host, unsigned seed);
// Makes and drops other objects of the plug-in.
ActorRef newPluginMaker(vexo::Host& host, unsigned seed);

}  // namespace soak
