#pragma once
// One component wired to terminals, drawn under the first terminal it stands for.
#include "CEItemDwg.h"

#include <QString>

class CESimboloDwg : public CEItemDwg {
public:
    using CEItemDwg::CEItemDwg;

    // Adds a terminal wired to the symbol.
    virtual void Liga(CEItemDwg* borne);

    // The symbol's label: the first non-empty of RELACAO, TAG, ETIQUETA.
    QString Rotulo() const;
};
