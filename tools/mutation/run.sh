#!/usr/bin/env bash
# The mutation check; see mutate.py for what it does and its options (--help).
exec python3 "$(dirname "$0")/mutate.py" "$@"
