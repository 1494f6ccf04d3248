#include "patch/xml_file.h"

const char kXmlLineBreak[] = "\r\n";
