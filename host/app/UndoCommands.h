#pragma once
// The host's UNDO [N] and REDO commands over the document's undo journal: the headless face
// of the desktop's Edit > Undo and Redo.
namespace zvhost {

class Application;

void registerUndoCommands(Application& app);

}  // namespace zvhost
