// A foundation header that reaches up into the manager: the layer check must refuse it.
#include "migrate/manager.h"
