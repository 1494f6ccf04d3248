#pragma once

// Numeric resource identifiers shared by the .rc and the code.
#define IDI_IRONVALE 109
#define IDR_EMBEDDED_FONT 110
#define IDD_LANGUAGE 134
#define IDC_LANGUAGE_LIST 1006
#define IDC_LANGUAGE_LABEL 1008
