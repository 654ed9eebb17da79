// The configuration file's folder comes from the document's LISP; kept apart so that the
// file's reader and writer build without the CAD facade (the fuzz target links them alone).
#include "CEExportConfigs.h"
#include "cad/CICad.h"

QString CEExportConfigs::PastaConfig() {
    return CICad::GetStringLisp("*DIR_ZVCFG*");
}

void CEExportConfigs::CarregaConfigs() {
    CarregaDe(PastaConfig());
}

bool CEExportConfigs::SalvaConfigs(QString* erro) const {
    return SalvaEm(PastaConfig(), erro);
}
