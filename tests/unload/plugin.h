#pragma once

/// What a plug-in that uses the library offers to a host that does not.
struct PluginInterface {
    /// Sets the log rules that the plug-in's preferences will give.
    void (*setRules)(const char* rules);
    /// Writes a line under the tag "app".
    void (*log)(const char* message);
    /// Charges a time in microseconds to a category.
    void (*charge)(const char* category, unsigned time);
    void (*freeSingletons)();
    /// The addresses of what has to be one in the process; ends with null.
    const void* const* (*sharedObjects)();
    /// Throws an exception class of the library.
    void (*throwNotFound)();
    /// Whether a thrower's exception is recognised.
    bool (*catchesNotFound)(void (*thrower)());
};

extern "C" typedef const PluginInterface* PluginEntry();
