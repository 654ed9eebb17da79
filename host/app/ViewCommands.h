#pragma once
// The host's view commands: ZOOM (window and extents), with a view per document, and the
// display commands that have nothing to do without a screen (REGEN, VIEWRES, PAN...).
namespace zvhost {

class Application;

void registerViewCommands(Application& app);

}  // namespace zvhost
