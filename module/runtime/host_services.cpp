#include "host_services.h"

const WCHAR EmptyString[1] = {0};
