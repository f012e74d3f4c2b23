#pragma once

#include "fn/message/dialog.h"

#include <mutex>
#include <string>
#include <vector>

/// Stands in for the message sink during a test, and keeps what came.
class RecordedDialog {
public:
    RecordedDialog() : body_(new Body) { FNDialog::set(body_); }
    ~RecordedDialog() { FNDialog::set({}); }
    RecordedDialog(const RecordedDialog&) = delete;
    RecordedDialog& operator=(const RecordedDialog&) = delete;

    /// "error: <text>" and so on.
    std::vector<std::string> messages() const { return body_.get()->messages(); }

private:
    class Body final : public FNDialog::Body {
    public:
        void log(const std::string& message) override { keep("log: " + message); }
        void info(const std::string& message) override { keep("info: " + message); }
        void warn(const std::string& message) override { keep("warn: " + message); }
        void error(const std::string& message) override { keep("error: " + message); }
        std::string name() const override { return "RecordedDlg"; }
        std::vector<std::string> messages() {
            const std::lock_guard lock(mutex_);
            return messages_;
        }

    private:
        void keep(const std::string& message) {
            const std::lock_guard lock(mutex_);
            messages_.push_back(message);
        }
        std::mutex mutex_;
        std::vector<std::string> messages_;
    };

    FNCountedPtr<Body> body_;
};
