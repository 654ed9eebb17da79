#include "CIProgress.h"

#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"

#include <QThread>

#include <charconv>

namespace {

constexpr qint64 kAbreSozinhaMs = 2000;
constexpr qint64 kTempoMinimoMs = 3000;
constexpr int kEsperaMs = 50;
constexpr int kEventosPorPasso = 100;
constexpr qint64 kIntervaloEventosMs = 20;

zvsdk::UserInterface* Interface() {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    return servicos ? servicos->userInterface() : nullptr;
}

}  // namespace

CIProgress::CIProgress(const QString& titulo) : titulo_(titulo) {
    criacao_.start();
}

CIProgress::~CIProgress() {
    if (aberta_) Fechar();
}

void CIProgress::Mostrar() {
    if (aberta_) return;
    aberta_ = true;
    if (zvsdk::UserInterface* ui = Interface()) ui->showProgress(titulo_);
}

void CIProgress::Definir(int percentual, const QString& texto) {
    percentual_ = percentual;
    if (!aberta_) {
        if (criacao_.elapsed() > kAbreSozinhaMs) Mostrar();
        return;
    }
    zvsdk::UserInterface* ui = Interface();
    if (!ui) return;
    ui->setProgress(percentual, texto.isEmpty() ? titulo_ : titulo_ + " ( " + texto + " )");
    if (eventos_.isValid() && eventos_.elapsed() < kIntervaloEventosMs) return;
    ui->processEvents(kEventosPorPasso);
    eventos_.start();
}

void CIProgress::Fechar() {
    zvsdk::UserInterface* ui = Interface();
    if (ui) ui->processEvents(kEventosPorPasso);
    if (!aberta_) return;
    // A short run waits a little so that its window does not just flicker; a host that
    // shows no window has nothing to wait for.
    if (ui && ui->showsProgress() && criacao_.elapsed() < kTempoMinimoMs)
        QThread::msleep(kEsperaMs);
    aberta_ = false;
    if (ui) ui->closeProgress();
}

QString CIProgress::Contagem(int k, int n) {
    char texto[32];
    char* fim = std::to_chars(texto, texto + 15, k).ptr;
    *fim++ = '/';
    fim = std::to_chars(fim, texto + sizeof texto, n).ptr;
    return QString::fromLatin1(texto, int(fim - texto));
}

bool CIProgress::Cancelado() {
    if (cancelado_) return true;
    zvsdk::UserInterface* ui = Interface();
    if (ui && ui->progressCancelled()) cancelado_ = true;
    return cancelado_;
}
