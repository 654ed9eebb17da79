#pragma once
// The desktop host in a test: one application with the module loaded, its main window on
// the offscreen platform, and a way to answer the window that a call opens.
#include "ProductFolder.h"

#include "desk/CommandLineDevice.h"
#include "desk/DeskTexts.h"
#include "desk/DeskUserInterface.h"
#include "desk/MainWindow.h"

#include "app/Application.h"

#include <gtest/gtest.h>

#include <QApplication>
#include <QDialog>
#include <QFileDialog>
#include <QFileInfo>
#include <QLineEdit>
#include <QMessageBox>
#include <QPointer>
#include <QTextStream>
#include <QTimer>

#include <functional>
#include <memory>

namespace zvtest {

// The one QApplication of the test program.
inline QApplication& desktopApplication() {
    static int argc = 1;
    static char name[] = "desk_tests";
    static char* argv[] = {name, nullptr};
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    static QApplication* app = new QApplication(argc, argv);
    return *app;
}

// Runs `answer` on the first modal window that comes up within `ms`, while the caller's
// call shows it. The answer gets the window (null when none came) and closes it. A window
// the answer left open (a refused accept, a message the window raised over itself) fails
// the test and is closed after a while, so that the call returns instead of hanging.
class ModalAnswer {
public:
    explicit ModalAnswer(std::function<void(QWidget*)> answer, int ms = 20000)
        : answer_(std::move(answer)) {
        timer_.setInterval(tick);
        QObject::connect(&timer_, &QTimer::timeout, [this, ms] { poll(ms); });
        timer_.start();
    }
    bool seen() const { return seen_; }

private:
    static constexpr int tick = 20;
    static constexpr int patience = 5000;

    void poll(int ms) {
        QWidget* modal = QApplication::activeModalWidget();
        waited_ += tick;
        if (answered_) return watch(modal);
        if (!modal && waited_ < ms) return;
        answered_ = true;
        seen_ = modal != nullptr;
        window_ = modal;
        answer_(modal);
        if (!modal) timer_.stop();
    }

    // Closes what stays up of the answered window, one modal window a tick.
    void watch(QWidget* modal) {
        const bool left = window_ && modal && (modal == window_ || window_->isAncestorOf(modal));
        if (!window_ || !window_->isVisible()) return timer_.stop();
        lingered_ = left ? lingered_ + tick : 0;
        if (lingered_ < patience) return;
        ADD_FAILURE() << "a window was left open: " << modal->metaObject()->className() << " \""
                      << modal->windowTitle().toStdString() << "\" "
                      << describe(modal).toStdString();
        lingered_ = 0;
        if (auto* dialog = qobject_cast<QDialog*>(modal))
            dialog->reject();
        else
            modal->close();
    }

    static QString describe(QWidget* modal) {
        auto* box = qobject_cast<QMessageBox*>(modal);
        return box ? box->text() : QString();
    }

    std::function<void(QWidget*)> answer_;
    QTimer timer_;
    QPointer<QWidget> window_;
    int waited_ = 0;
    int lingered_ = 0;
    bool answered_ = false;
    bool seen_ = false;
};

// Chooses `file` in a file dialog by its whole path in the name field, then accepts. Typing
// the path does not depend on the folder view having been read yet, nor on where the focus
// is, as choosing an entry of the view does.
inline void chooseFile(QFileDialog* dialog, const QString& file) {
    auto* name = dialog->findChild<QLineEdit*>(QStringLiteral("fileNameEdit"));
    ASSERT_NE(name, nullptr);
    name->setText(QFileInfo(file).absoluteFilePath());
    static_cast<QDialog*>(dialog)->accept();
}

// A product folder (catalogue, templates, configuration, a generated project) shared by a
// suite, and an application with a main window for each test.
class DeskTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        desktopApplication();
        product_ = new ProductFolder;
        const QString problem = product_->prepare();
        ASSERT_TRUE(problem.isEmpty()) << problem.toStdString();
        // The module's commands run in this process: they read the same folders.
        qputenv("ZV_DATA_DIR", product_->path("dados").toUtf8());
        qputenv("ZV_PRODUCT_DIR", (product_->path("produto") + "/").toUtf8());
    }
    static void TearDownTestSuite() {
        delete product_;
        product_ = nullptr;
    }

    void SetUp() override {
        zvdesk::DeskTexts::setLanguage(2);
        out_ = std::make_unique<QTextStream>(&device_);
        out_->setCodec("UTF-8");
        auto ui = std::make_unique<zvdesk::DeskUserInterface>();
        ui_ = ui.get();
        ui_->setFileOpener([this](const QString& path) { shown_ << path; });
        app_ = std::make_unique<zvhost::Application>(std::move(ui), *out_);
        app_->setExecutableFolder(ZV_BIN_DIR);
        window_ = std::make_unique<zvdesk::MainWindow>(*app_, *ui_);
        device_.setListener([this](const QString& text) {
            commandLine_ += text;
            if (window_) window_->print(text);
        });
        window_->setLoadFiles({product_->path("produto/config/zvconfig.lsp")});
        if (loadModule_) {
            QString error;
            ASSERT_TRUE(app_->loadModule(ZV_BIN_DIR "/libzvlistas.so", &error))
                << error.toStdString();
        }
        window_->show();
    }
    void TearDown() override {
        device_.setListener({});
        window_.reset();
        app_.reset();
    }

    // A copy of the generated project, for a test to change.
    static QString copyOfProject(const QString& name) {
        const QString path = product_->path(name);
        QFile::remove(path);
        EXPECT_TRUE(QFile::copy(product_->project(), path));
        QFile(path).setPermissions(QFile::ReadOwner | QFile::WriteOwner);
        return path;
    }
    static QString path(const QString& name) { return product_->path(name); }

    static ProductFolder* product_;
    bool loadModule_ = true;
    zvdesk::CommandLineDevice device_;
    QString commandLine_;
    std::unique_ptr<QTextStream> out_;
    zvdesk::DeskUserInterface* ui_ = nullptr;
    std::unique_ptr<zvhost::Application> app_;
    std::unique_ptr<zvdesk::MainWindow> window_;
    QStringList shown_;
};

inline ProductFolder* DeskTest::product_ = nullptr;

}  // namespace zvtest
