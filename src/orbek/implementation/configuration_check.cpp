#include "orbek/implementation/configuration_check.h"

#include "fn/deployment/composite_values.h"
#include "fn/deployment/value_check.h"
#include "fn/text_forms.h"

#include <algorithm>
#include <map>
#include <numeric>
#include <optional>

namespace Orbek {

using namespace Fn::Deployment;

namespace {

/// Single characters that have to be put in, left out or replaced.
std::size_t editDistance(const std::string& a, const std::string& b) {
    std::vector<std::size_t> row(b.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 0; i < a.size(); ++i) {
        std::size_t diagonal = row[0]++;
        for (std::size_t j = 0; j < b.size(); ++j) {
            const std::size_t replaced = diagonal + (a[i] != b[j]);
            diagonal = row[j + 1];
            row[j + 1] = std::min({replaced, row[j] + 1, diagonal + 1});
        }
    }
    return row.back();
}

/// ", did you mean ...", or nothing if no name is near.
std::string suggestion(const std::string& path, const std::string& name,
                       const std::list<std::string>& names) {
    constexpr std::size_t likely = 2;
    const auto distance = [&](const std::string& other) { return editDistance(name, other); };
    const auto nearest = std::ranges::min_element(names, {}, distance);
    if (nearest == names.end() || distance(*nearest) > likely) return "";
    return "; did you mean " + (path.empty() ? "" : path + ".") + *nearest + "?";
}

const std::string unknown = "is no key of the configuration";

/// A key is followed through the tree, from its root down.
class KeyCheck {
public:
    explicit KeyCheck(const std::list<Component>& roots) : roots_(roots) {}

    /// What is wrong with a line, empty if nothing is.
    std::string fault(const std::string& key, const std::string& value) const {
        if (key == "FNAppConfigLogAccess") return ""; // of the database itself
        const std::string suffix = ".default";
        const bool isDefault = key.ends_with(suffix);
        std::string reason;
        const std::optional<Component> node =
            find(isDefault ? key.substr(0, key.size() - suffix.size()) : key, isDefault, reason);
        return node ? faultOfValue(node->type(), withVariables(value, roots_.front())) : reason;
    }

private:
    /// The node of a key. @param isDefault of all nodes that the key fits; "*" stands for a root or an
    /// element
    /// @param reason why there is none
    std::optional<Component> find(const std::string& key, bool isDefault, std::string& reason) const {
        std::list<std::string> parts = Fn::splitText(key, '.'); // without empty ones
        const std::string first = parts.empty() ? "" : parts.front();
        if (key.starts_with('.') || key.ends_with('.') || key.find("..") != std::string::npos) {
            reason = unknown;
            return {};
        }
        const auto root = std::ranges::find_if(
            roots_, [&](const Component& r) { return r.name() == first || (isDefault && first == "*"); });
        if (root == roots_.end()) {
            std::list<std::string> names;
            for (const Component& r : roots_) names.push_back(r.name());
            reason = unknown + suggestion("", first, names);
            return {};
        }
        parts.pop_front();
        Component node = *root;
        for (const std::string& part : parts) {
            if (!isContainer(node.type()) && !findProperty(membersOf(node.type()), part)) {
                std::list<std::string> names;
                for (const Property& member : membersOf(node.type())) names.push_back(member.name());
                reason = unknown + suggestion(node.name(), part, names);
                return {};
            }
            if (!isDefault && isContainer(node.type()) && !isReached(node, part)) {
                reason = "has no effect, since " + node.name() + " does not list " + part;
                return {};
            }
            node = node.subComponent(part);
        }
        return node;
    }

    /// Devices are made by their names; other elements count only if their container lists them.
    static bool isReached(const Component& container, const std::string& element) {
        return container.name() == "ORBEK.CaptureDevices" || listsElement(container, element);
    }

    const std::list<Component>& roots_;
};

} // namespace

std::vector<Configuration::Fault> configurationFaults(const std::vector<AppConfigDB::Line>& lines,
                                                      const std::list<Component>& roots) {
    const KeyCheck check(roots);
    std::vector<Configuration::Fault> faults;
    std::map<std::string, int> lineOf;
    for (const AppConfigDB::Line& line : lines) {
        const auto [first, isFirst] = lineOf.emplace(line.key, line.number);
        const std::string reason =
            isFirst ? check.fault(line.key, line.value)
                    : "has no effect, since it stands in line " + std::to_string(first->second) + " already";
        if (!reason.empty()) faults.push_back({line.number, line.key, reason});
    }
    return faults;
}

std::string withVariables(const std::string& text, const Component& root) {
    std::string replaced = text;
    if (text.find('$') == std::string::npos) return replaced;
    const Component variables = root.subComponent("Substitutions");
    for (const Component& variable : variables.subComponents()) {
        const std::string name = "$" + variable.name().substr(variables.name().size() + 1),
                          value = variable.read(true);
        for (std::size_t at = replaced.find(name); at != std::string::npos;
             at = replaced.find(name, at + value.size()))
            replaced.replace(at, name.size(), value);
    }
    return replaced;
}

} // namespace Orbek
