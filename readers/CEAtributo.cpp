#include "CEAtributo.h"

#include "cad/CICad.h"

namespace zv {

CEAtributo& CEAtributo::operator=(const CEAtributo& outro) {
    tag_ = outro.tag_;
    prompt_ = outro.prompt_;
    valor_ = outro.valor_;
    objectId_ = outro.objectId_;
    invisivel_ = outro.invisivel_;
    rascunho_.clear();
    return *this;
}

void CEAtributo::SetValor(const QString& valor) {
    valor_ = valor;
    if (!objectId_.isNull()) CICad::SetValorAtributo(objectId_, valor);
}

void CEAtributo::SetInvisivel(bool invisivel, bool gravar) {
    invisivel_ = invisivel;
    if (gravar && !objectId_.isNull()) CICad::SetInvisivelAtributo(objectId_, invisivel);
}

}  // namespace zv
