#include "base/xml_file.h"

const char kXmlLineBreak[] = "\r\n";
