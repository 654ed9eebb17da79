#pragma once
// One attribute of a block reference (or a virtual attribute) as the lists see it.
#include "cad/OdDbObjectId.h"

#include <QString>

namespace zv {

class CEAtributo {
public:
    CEAtributo(const QString& tag, const QString& prompt, const QString& valor,
               const OdDbObjectId& id, bool invisivel)
        : tag_(tag), prompt_(prompt), valor_(valor), objectId_(id), invisivel_(invisivel) {}
    // A copy keeps all but the scratch text.
    CEAtributo(const CEAtributo& outro)
        : tag_(outro.tag_),
          prompt_(outro.prompt_),
          valor_(outro.valor_),
          objectId_(outro.objectId_),
          invisivel_(outro.invisivel_) {}
    CEAtributo& operator=(const CEAtributo& outro);

    const QString& GetTag() const { return tag_; }
    const QString& GetPrompt() const { return prompt_; }
    const QString& GetValor() const { return valor_; }
    const OdDbObjectId& GetId() const { return objectId_; }
    bool IsInvisivel() const { return invisivel_; }
    // Also writes the value to the attribute in the drawing.
    void SetValor(const QString& valor);
    // Writes through to the drawing only when asked, for a valid id, and when it changes.
    void SetInvisivel(bool invisivel, bool gravar = false);

private:
    QString tag_;
    QString prompt_;
    QString valor_;
    QString rascunho_;  // reset on creation, never read by the lists
    OdDbObjectId objectId_;
    bool invisivel_ = false;
};

}  // namespace zv
