# vantrel_device_modules(<target> <key>=<file> ...): compiles device files for every target and embeds them.
