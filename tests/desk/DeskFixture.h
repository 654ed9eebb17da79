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
// call shows it. The answer gets the window (null when none came) and closes it.
class ModalAnswer {
public:
    explicit ModalAnswer(std::function<void(QWidget*)> answer, int ms = 20000)
        : answer_(std::move(answer)) {
        timer_.setInterval(20);
        QObject::connect(&timer_, &QTimer::timeout, [this, ms] {
            QWidget* modal = QApplication::activeModalWidget();
            waited_ += 20;
            if (!modal && waited_ < ms) return;
            timer_.stop();
            seen_ = modal != nullptr;
            answer_(modal);
        });
        timer_.start();
    }
    bool seen() const { return seen_; }

private:
    std::function<void(QWidget*)> answer_;
    QTimer timer_;
    int waited_ = 0;
    bool seen_ = false;
};

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
