// ProgrammingError: the loud end of a programming error (an abstract operation reached).
#pragma once

namespace vantorel {

class ProgrammingError {
public:
    // Logs "<class>: unrecognised operation <op> sent to instance <p>" at error
    // priority, prints it to stderr, and aborts: callers never rely on a return.
    [[noreturn]] static void unrecognisedOperation(const char* className, const char* operation,
                                                   const void* instance);
};

}  // namespace vantorel
