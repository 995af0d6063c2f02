#pragma once

/// What a screen shows that asks before it applies something.
constexpr const char *confirmationText = "ESC   - Cancel\nENTER - Apply";
