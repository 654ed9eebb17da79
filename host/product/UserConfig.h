#pragma once
// The user's configuration LISP file, loaded into every document before anything else:
// $ZV_DATA_DIR/zvconfig.lsp, or $ZV_DATA_DIR/config/zvconfig.lsp when ZV_DATA_DIR names a
// product data folder. Users set folders (*DIR_ZVCFG_TEMPL*, *DIRETORIO_REDE*,
// *DIR_ZVCFG*), default templates, PBL switches and the like there.
#include <QString>

namespace zvlisp {
class Interpreter;
}

namespace zvproduct {

class UserConfig {
public:
    // The file to load; empty when there is none.
    static QString file();
    // Loads `path`; false with the error on the interpreter's output when it fails.
    static bool load(zvlisp::Interpreter& lisp, const QString& path);
};

}  // namespace zvproduct
