// Configuration texts: what is accepted reads back the same after it was written out line by line.

#include "fn/deployment/app_config_db.h"
#include "fn/exception.h"
#include "fn/text_forms.h"

#include <cstdlib>
#include <sstream>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    try {
        std::istringstream stream(text);
        const AppVolatileConfigDB db(stream);
        const std::string key = AppConfigDB::makeCompatibleKey(text.substr(0, text.find('=')));
        if (!db.exists(key)) return 0;
        std::istringstream again(key + " = " + db.get(key) + "\n");
        if (AppVolatileConfigDB(again).get(key) != db.get(key)) std::abort();
    } catch (const FNEIOError&) {
        // a syntax error
    }
    const std::string stored = Fn::MapCharsToHex(text, '%', Fn::controlChars);
    if (Fn::UnmapCharsFromHex(stored, '%') != text) std::abort();
    Fn::UnmapCharsFromHex(text, '%');
    return 0;
}
