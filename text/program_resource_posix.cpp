#include <cstring>

#include "text/embedded_resources.h"
#include "text/program_resource.h"

bool FindProgramResource(const char* name, const char* type, ResourceBytes& bytes) {
    for (size_t i = 0; i < kEmbeddedResourceCount; ++i) {
        const EmbeddedResource& resource = kEmbeddedResources[i];
        if (std::strcmp(resource.name, name) == 0 && std::strcmp(resource.type, type) == 0) {
            if (resource.size == 0) return false;
            bytes.data = resource.data;
            bytes.size = resource.size;
            return true;
        }
    }
    return false;
}
