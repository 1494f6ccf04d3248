#pragma once

#include <string>

// The publisher's public key (PEM) this program was built with: the CMake
// option IRONVALE_PUBLIC_KEY embeds it as the resource IDR_PUBLIC_KEY of
// type PEM. With it, every patch description must carry the publisher's
// signature; without it (empty) descriptions are taken as they come.
std::string BuiltInPublisherKey();
