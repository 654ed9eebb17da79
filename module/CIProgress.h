#pragma once
// The progress surface of a run: a bar from 0 to 100 and one line of text. A new one is
// silent; it opens when asked, or by itself when a run passes two seconds.
#include <QElapsedTimer>
#include <QString>

class CIProgress {
public:
    explicit CIProgress(const QString& titulo = QStringLiteral("ZVListas"));
    ~CIProgress();
    CIProgress(const CIProgress&) = delete;
    CIProgress& operator=(const CIProgress&) = delete;

    void Mostrar();
    // Stores the percent; an open window shows "title ( text )" and, at most every 20 ms,
    // lets the host handle up to 100 pending events (a reader that steps once per entity
    // would spend more on the host's event loop than on its entities).
    void Definir(int percentual, const QString& texto = QString());
    // Pumps pending events and closes; a shown window open less than three seconds after its
    // creation waits 50 ms once, so a fast run does not just flicker.
    void Fechar();
    // The text "k/n" of a step counted over a run, made without the format machinery: a
    // reader that steps once per entity makes thousands.
    static QString Contagem(int k, int n);

    // The cancel flag: set by Cancelar() or by the user through the host; a long run tests
    // it between its steps and ends early.
    void Cancelar() { cancelado_ = true; }
    bool Cancelado();

    int Percentual() const { return percentual_; }
    bool Aberta() const { return aberta_; }

private:
    QString titulo_;
    QElapsedTimer criacao_;
    QElapsedTimer eventos_;  // since the host last handled events for this window
    int percentual_ = 0;
    bool aberta_ = false;
    bool cancelado_ = false;
};
