#include "app/entry.h"

// A build for a publisher with its own server sets it (CMake option
// IRONVALE_UPDATE_LOCATION, for example "http://patches.example.com/ironvale").
const char* const kBuiltInUpdateLocation = IRONVALE_UPDATE_LOCATION;
