#include "app/publisher_key.h"

#include "text/program_resource.h"

std::string BuiltInPublisherKey() {
    ResourceBytes bytes;
    if (!FindProgramResource("IDR_PUBLIC_KEY", "PEM", bytes)) return std::string();
    return std::string(reinterpret_cast<const char*>(bytes.data), bytes.size);
}
