# Sourced by the stages that run the tool: from the project folder, builds
# the tool in the dev preset's build (VELTMARQUIST_STAGE_BUILD names another)
# and sets $build and $tool.
build=${VELTMARQUIST_STAGE_BUILD:-build/dev}
[ -f "$build/CMakeCache.txt" ] || cmake --preset dev >/dev/null
cmake --build "$build" --target veltmarquist >/dev/null
tool="$build/tools/veltmarquist"
