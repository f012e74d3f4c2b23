#pragma once

#include "fn/callback/composite.h"
#include "fn/cptr.h"

#include <string>

/// The process-wide sink of messages: non-fatal reports go here. The host application may exchange it.
///
///     FNDialog::warn("camera is slow");
class FNDialog {
public:
    class Body {
    public:
        virtual ~Body() = default;
        virtual void log(const std::string& message) = 0;
        virtual void info(const std::string& message) = 0;
        virtual void warn(const std::string& message) = 0;
        virtual void error(const std::string& message) = 0;
        virtual std::string name() const = 0;
    };

    /// The present sink, an FNStdDialog at first.
    static FNCountedPtr<Body> get();
    /// Replaces the sink; null puts back a new FNStdDialog.
    static void set(const FNCountedPtr<Body>& body);

    static void log(const std::string& message) { get()->log(message); }
    static void info(const std::string& message) { get()->info(message); }
    static void warn(const std::string& message) { get()->warn(message); }
    static void error(const std::string& message) { get()->error(message); }
};

/// One line for each message, with the local time, on the standard streams.
class FNStdDialog final : public FNDialog::Body {
public:
    void log(const std::string& message) override;
    void info(const std::string& message) override;
    void warn(const std::string& message) override;
    void error(const std::string& message) override;
    std::string name() const override { return "StdDlg"; }
};

/// Passes each message to all of its children, in the order of their names.
class FNCompositeDialog final : public FNDialog::Body {
public:
    void add(const std::string& name, const FNCountedPtr<FNDialog::Body>& child) {
        children_.add(name, child);
    }
    void remove(const std::string& name) { children_.remove(name); }

    void log(const std::string& message) override { each(&Body::log, message); }
    void info(const std::string& message) override { each(&Body::info, message); }
    void warn(const std::string& message) override { each(&Body::warn, message); }
    void error(const std::string& message) override { each(&Body::error, message); }
    std::string name() const override { return "CompositeDlg"; }

private:
    void each(void (Body::*operation)(const std::string&), const std::string& message) {
        children_.forEach([&](const FNCountedPtr<Body>& child) { (child.get()->*operation)(message); });
    }

    FNComposite<FNCountedPtr<FNDialog::Body>> children_;
};

/// The system log; without effect on this platform.
class FNSyslogDialog final : public FNDialog::Body {
public:
    explicit FNSyslogDialog(const std::string& applicationName) : applicationName_(applicationName) {}
    void log(const std::string&) override {}
    void info(const std::string&) override {}
    void warn(const std::string&) override {}
    void error(const std::string&) override {}
    std::string name() const override { return "SysLogDlg"; }

private:
    std::string applicationName_;
};
