// Translation tables: whatever comes, loading ends with at most one message.

#include "fn/message/translator.h"
#include "fn/message/dialog.h"

#include <cstdlib>
#include <sstream>

namespace {

int messages = 0;

class Counting final : public FNDialog::Body {
    void log(const std::string&) override { ++messages; }
    void info(const std::string&) override { ++messages; }
    void warn(const std::string&) override { ++messages; }
    void error(const std::string&) override { ++messages; }
    std::string name() const override { return "Counting"; }
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    static const bool quiet = (FNDialog::set(FNCountedPtr<FNDialog::Body>(new Counting)), true);
    (void)quiet;
    messages = 0;
    FNTranslator translator("Eng");
    std::istringstream table(std::string(reinterpret_cast<const char*>(data), size));
    translator.loadDb(table, "fuzzed");
    if (messages > 1 || translator.translate("never a key of a table: \n") != "never a key of a table: \n")
        std::abort();
    return 0;
}
