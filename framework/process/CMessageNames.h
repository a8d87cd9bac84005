#pragma once

#include "framework/process/CObjID.h"

namespace Tarsa {

// The framework's message and command names, interned together the first
// time any of them is asked for (the process asks at construction). One
// instance, never changed after it is made.
struct CMessageNames {
  // Windows
  CObjID windowMove, windowResize, popupClosed;
  // Keys
  CObjID keyDown, keyUp, keyChar, keyDeadChar;
  CObjID sysKeyDown, sysKeyUp, sysKeyChar, sysKeyDeadChar;
  // Mouse
  CObjID mouseDown, mouseUp, mouseMoved;
  // Panes
  CObjID disposePane, sizeBoxBegin, sizeBoxEnd;
  // Commands
  CObjID cmdAbout, cmdHelp, cmdNew, cmdOpen, cmdClose, cmdSave, cmdSaveAs, cmdSaveCopyAs;
  CObjID cmdRevert, cmdPrint, cmdPageSetup, cmdQuit;
  CObjID cmdUndo, cmdRedo, cmdUndoRedo, cmdStepBackward, cmdStepForward;
  CObjID cmdCut, cmdCopy, cmdPaste, cmdClear, cmdSelectAll, cmdSelectNone, cmdPreferences;

  static const CMessageNames& Get();

 private:
  CMessageNames();
};

}  // namespace Tarsa
