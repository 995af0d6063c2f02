#pragma once

/// The one object that `create` makes: on the first call, with `new`, and never destroyed. Each
/// `create` has an object of its own, so a class calls this in one place only, its `instance()`.
/// When the constructor throws, the next call tries again.
template <typename Create> auto onlyOne(Create create) {
    static decltype(create()) object = nullptr;
    if (object == nullptr)
        object = create();
    return object;
}
