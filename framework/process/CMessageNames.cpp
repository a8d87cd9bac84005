#include "framework/process/CMessageNames.h"

namespace Tarsa {

CMessageNames::CMessageNames()
    : windowMove(CObjID::Intern("Tarsa/Message/WindowMove")),
      windowResize(CObjID::Intern("Tarsa/Message/WindowResize")),
      popupClosed(CObjID::Intern("Tarsa/Message/PopupClosed")),
      keyDown(CObjID::Intern("Tarsa/Message/KeyDown")),
      keyUp(CObjID::Intern("Tarsa/Message/KeyUp")),
      keyChar(CObjID::Intern("Tarsa/Message/KeyChar")),
      keyDeadChar(CObjID::Intern("Tarsa/Message/KeyDeadChar")),
      sysKeyDown(CObjID::Intern("Tarsa/Message/SysKeyDown")),
      sysKeyUp(CObjID::Intern("Tarsa/Message/SysKeyUp")),
      sysKeyChar(CObjID::Intern("Tarsa/Message/SysKeyChar")),
      sysKeyDeadChar(CObjID::Intern("Tarsa/Message/SysKeyDeadChar")),
      mouseDown(CObjID::Intern("Tarsa/Message/MouseDown")),
      mouseUp(CObjID::Intern("Tarsa/Message/MouseUp")),
      mouseMoved(CObjID::Intern("Tarsa/Message/MouseMoved")),
      disposePane(CObjID::Intern("Tarsa/Message/DisposePane")),
      sizeBoxBegin(CObjID::Intern("tarsa/message/sizeBoxBegin")),
      sizeBoxEnd(CObjID::Intern("tarsa/message/sizeBoxEnd")),
      cmdAbout(CObjID::Intern("tarsa/command/about")),
      cmdHelp(CObjID::Intern("tarsa/command/help")),
      cmdNew(CObjID::Intern("tarsa/command/new")),
      cmdOpen(CObjID::Intern("tarsa/command/open")),
      cmdClose(CObjID::Intern("tarsa/command/close")),
      cmdSave(CObjID::Intern("tarsa/command/save")),
      cmdSaveAs(CObjID::Intern("tarsa/command/saveAs")),
      cmdSaveCopyAs(CObjID::Intern("tarsa/command/saveCopyAs")),
      cmdRevert(CObjID::Intern("tarsa/command/revert")),
      cmdPrint(CObjID::Intern("tarsa/command/print")),
      cmdPageSetup(CObjID::Intern("tarsa/command/pageSetup")),
      cmdQuit(CObjID::Intern("tarsa/command/quit")),
      cmdUndo(CObjID::Intern("tarsa/command/undo")),
      cmdRedo(CObjID::Intern("tarsa/command/redo")),
      cmdUndoRedo(CObjID::Intern("tarsa/command/undoRedo")),
      cmdStepBackward(CObjID::Intern("tarsa/command/stepBackward")),
      cmdStepForward(CObjID::Intern("tarsa/command/stepForward")),
      cmdCut(CObjID::Intern("tarsa/command/cut")),
      cmdCopy(CObjID::Intern("tarsa/command/copy")),
      cmdPaste(CObjID::Intern("tarsa/command/paste")),
      cmdClear(CObjID::Intern("tarsa/command/clear")),
      cmdSelectAll(CObjID::Intern("tarsa/command/selectAll")),
      cmdSelectNone(CObjID::Intern("tarsa/command/selectNone")),
      cmdPreferences(CObjID::Intern("tarsa/command/preferences")) {}

const CMessageNames& CMessageNames::Get() {
  static const CMessageNames names;
  return names;
}

}  // namespace Tarsa
