#include "plugins/objects/every_language.h"
