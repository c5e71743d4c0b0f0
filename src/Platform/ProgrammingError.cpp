// ProgrammingError: where an abstract operation that a subclass should have replaced ends the program.
#include "Platform/ProgrammingError.h"

#include "Platform/SystemLog.h"

#include <cstdio>
#include <cstdlib>

namespace vantorel {

void ProgrammingError::unrecognisedOperation(const char* className, const char* operation,
                                             const void* instance) {
    SystemLog::log(SystemLog::kError, "%s: unrecognised operation %s sent to instance %p", className,
                   operation, instance);
    std::fprintf(stderr, "%s: unrecognised operation %s sent to instance %p\n", className, operation,
                 instance);
    std::abort();
}

}  // namespace vantorel
