// The edition may use the manager but not its internals.
#include "migrate/manager.h"
#include "migrate/internal/marked_name.h"
