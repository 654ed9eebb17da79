#include "DocumentSetup.h"

#include "HostDocument.h"

namespace zvhost {

void setUpDocument(HostDocument& document) {
    // The LISP environment and the product's functions are installed here as they land.
    Q_UNUSED(document);
}

}  // namespace zvhost
