#pragma once

// Marks what a host library exports; the plug-in links against these names.
#define QELT_HOST_API __attribute__((visibility("default")))
