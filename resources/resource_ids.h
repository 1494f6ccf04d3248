#pragma once

// Numeric resource identifiers shared by the .rc and the code.
#define IDI_IRONVALE 109
