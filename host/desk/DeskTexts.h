#pragma once
// The desktop's own words (menus, buttons, window titles, its messages) in the user's
// language: 1 Portuguese, 2 English, 3 Spanish, from the product setting IdiomaMenuSel
// (0 or unknown reads as English, as the message files read it). The module's own texts
// come from its message files and arrive here already translated.
#include <QString>

namespace zvdesk {

enum class Text {
    FileMenu,
    Open,
    Save,
    SaveAs,
    Quit,
    EditMenu,
    Undo,
    Redo,
    ViewMenu,
    Fit,
    ZoomIn,
    ZoomOut,
    CommandsMenu,
    OtherCommands,
    HelpMenu,
    About,
    Pages,
    Console,
    Evaluate,
    Cover,
    Index,
    Yes,
    No,
    Ok,
    Cancel,
    SelectAll,
    SelectNone,
    PickPages,
    PickStrips,
    Input,
    Progress,
    Drawings,
    AllFiles,
    Untitled,
    UnsavedTitle,
    UnsavedText,
    Discard,
    CannotOpen,
    CannotSave,
    Saved,
    CommandRunning,
    CommandFailed,
    CommandCancelled,
    CommandOutOfMemory,
    CommandDone,
    NoModule,
    Ready,
    // The module's twelve commands, in their table order.
    CmdTerminalList,
    CmdStripDrawing,
    CmdWireList,
    CmdMaterialList,
    CmdCableList,
    CmdExport,
    CmdExportWires,
    CmdExportFerrules,
    CmdExportTerminals,
    CmdExportMaterials,
    CmdExportCables,
    CmdTopographic,
    Count
};

class DeskTexts {
public:
    // The language of the settings file, read now.
    static int settingsLanguage();
    // 1 Portuguese, 2 English, 3 Spanish; anything else is English.
    static void setLanguage(int language);
    static int language();
    static QString text(Text which);
};

inline QString words(Text which) {
    return DeskTexts::text(which);
}

}  // namespace zvdesk
