#pragma once
// The host's view commands: ZOOM (window and extents) and REGEN, with a view per document.
namespace zvhost {

class Application;

void registerViewCommands(Application& app);

}  // namespace zvhost
