#include <openssl/evp.h>

#include "net/md5.h"

bool Md5Digest(const char* data, size_t size, uint8_t (&digest)[16]) {
    unsigned int length = 0;
    return EVP_Digest(data, size, digest, &length, EVP_md5(), nullptr) == 1 && length == sizeof(digest);
}
