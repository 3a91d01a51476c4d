/// What the shared runtime library shows to programs and plug-ins. One copy of its registries serves them all.
#pragma once

#define CLIPSA_RUNTIME __attribute__((visibility("default")))
