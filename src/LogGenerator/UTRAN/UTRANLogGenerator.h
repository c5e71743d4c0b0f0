// UTRANLogGenerator: the UTRAN decoder: the template-driven generator on the first "UTRAN" template with UTRANClassIndex.
#pragma once

#include "LogGenerator/MVKLogGenerator2.h"

#include <memory>

namespace vantorel {

class UTRANLogGenerator : public MVKLogGenerator2 {
public:
    // `generator` / `init`: the template is the first property-list resource whose
    // path contains "UTRAN" (case ignored). With none, the object is never
    // initialised as a generator (isUsable() is false) and nothing is logged.
    static std::unique_ptr<LogGenerator> generator();

private:
    UTRANLogGenerator() = default;
    UTRANLogGenerator(std::string pListName, std::unique_ptr<ClassIndex> cIndexObj)
        : MVKLogGenerator2(std::move(pListName), std::move(cIndexObj)) {}
};

}  // namespace vantorel
