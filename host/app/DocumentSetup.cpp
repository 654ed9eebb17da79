#include "DocumentSetup.h"

#include "CadLisp.h"
#include "DocumentLisp.h"
#include "HostDocument.h"

#include <QFileInfo>

namespace zvhost {

void setUpDocument(HostDocument& document) {
    // The LISP environment prints on the document's command line; load and findfile look
    // in the drawing's folder after the current one.
    auto lisp = std::make_unique<DocumentLisp>(
        [&document](const QString& text) { document.printMessage(text); });
    if (!document.fileName().isEmpty())
        lisp->interpreter().searchPaths() << QFileInfo(document.fileName()).absolutePath();
    installCadFunctions(lisp->interpreter(), document);
    document.setLisp(std::move(lisp));
}

}  // namespace zvhost
