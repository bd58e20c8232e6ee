// Crypt may use the foundation only.
#include "foundation/string/string_base.h"
#include <nettle/twofish.h>
