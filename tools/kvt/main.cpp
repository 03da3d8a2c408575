// The kvt program. What it does stands in the *_command.cpp files; here is what becomes of a failure.

#include "base/diagnostics.h"
#include "base/failure.h"
#include "base/interrupt.h"
#include "base/messages.h"
#include "cli/command_line.h"
#include "cli/exit_status.h"

#include <kvt/foundation/throwable.h>

#include <exception>
#include <new>

int main(int argc, char** argv) {
    host::prepareProcess();
    host::Diagnostics diagnostics;
    try {
        return host::runCommandLine(argc, argv, diagnostics);
    } catch (const host::ClosedPipe&) {
        // Nobody listens, so there is nothing to say. All that was temporary is gone by now.
        host::dieOfClosedPipe();
    } catch (const kvt::ex::Throwable& failure) {
        diagnostics.fail(host::describe(failure));
    } catch (const std::bad_alloc&) {
        diagnostics.fail("out of memory");
    } catch (const host::Failure& failure) {
        diagnostics.fail(failure.what());
    } catch (const std::exception& failure) {
        diagnostics.fail(host::describe(failure));
    }
    return host::NotDone;
}
