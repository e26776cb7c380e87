// The standard headers need a target that parses them; this is its source.
