#include "DocumentSetup.h"

#include "Application.h"
#include "CadLisp.h"
#include "ConnectionChains.h"
#include "DocumentLisp.h"
#include "HostDocument.h"
#include "PositionChains.h"
#include "SystemLisp.h"
#include "product/ConnectionAnswers.h"
#include "product/ProductLisp.h"
#include "product/SheetGridIndex.h"
#include "product/UserConfig.h"

#include <QFileInfo>

namespace zvhost {

namespace {

// The product's LISP functions on this document, then the user's configuration file.
void installProduct(DocumentLisp& documentLisp, HostDocument& document) {
    zvlisp::Interpreter& lisp = documentLisp.interpreter();
    zvproduct::ProductContext context;
    context.database = [&document] { return document.database(); };
    context.userInterface = [] {
        return Application::instance() ? Application::instance()->userInterface() : nullptr;
    };
    context.print = [&document](const QString& text) { document.printMessage(text); };
    context.fileName = [&document] { return document.fileName(); };
    context.connections = std::make_shared<zvproduct::ConnectionAnswers>();
    context.sheetGrids = std::make_shared<zvproduct::SheetGridIndex>();
    zvproduct::installProductFunctions(lisp, context);
    ConnectionChains::install(documentLisp, context);
    PositionChains::install(documentLisp, context);
    const QString config = zvproduct::UserConfig::file();
    if (!config.isEmpty()) zvproduct::UserConfig::load(lisp, config);
}

}  // namespace

void setUpDocument(HostDocument& document) {
    // The LISP environment prints on the document's command line; load and findfile look
    // in the drawing's folder after the current one.
    auto lisp = std::make_unique<DocumentLisp>(
        [&document](const QString& text) { document.printMessage(text); });
    if (!document.fileName().isEmpty())
        lisp->interpreter().searchPaths() << QFileInfo(document.fileName()).absolutePath();
    lisp->interpreter().unitTableFile =
        (Application::instance() ? Application::instance()->executableFolder() : QString()) +
        "/program/units.txt";
    installCadFunctions(lisp->interpreter(), document);
    installSystemFunctions(lisp->interpreter());
    installProduct(*lisp, document);
    document.setLisp(std::move(lisp));
}

}  // namespace zvhost
