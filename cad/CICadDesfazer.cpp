// The facade's undo bracket: the host records a command's whole batch as one step.
#include "CICad.h"

#include "sdk/Document.h"
#include "sdk/SystemServices.h"

void CICad::AbreDesfazer() {
    if (zvsdk::Document* documento = zvsdk::activeDocument()) documento->beginUndoGroup();
}

void CICad::FechaDesfazer() {
    if (zvsdk::Document* documento = zvsdk::activeDocument()) documento->endUndoGroup();
}
