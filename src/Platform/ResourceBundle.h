// ResourceBundle: lists and loads the application's property-list resources (Qt resources from resources/templates/).
#pragma once

#include "PropertyList/Value.h"

#include <optional>
#include <string>
#include <vector>

namespace vantorel {

class ResourceBundle {
public:
    // The folder searched, ":/templates" (compiled-in resources) unless changed.
    static std::string directory();
    // Points the bundle at another folder (a real directory or a resource prefix);
    // an empty text restores the default. Tests and --templates use it.
    static void setDirectory(const std::string& dir);

    // Paths of the top-level resources of that type, in the listing's order (by name).
    static std::vector<std::string> pathsForResourcesOfType(const std::string& extension);
    // The resource name.extension parsed as a property list; empty when it is missing
    // or does not parse.
    static std::optional<Value> loadPropertyList(const std::string& name, const std::string& extension);
};

}  // namespace vantorel
