#!/usr/bin/env bash
# Installs the build to a temporary prefix, builds the examples against it with find_package (and
# the headless one with pkg-config too), and runs the headless example: the package is whole.
#   install_test.sh <build folder> <source folder> <work folder>
set -euo pipefail
build=$1 source=$2 work=$3
rm -rf "$work"
prefix=$work/prefix
cmake --install "$build" --prefix "$prefix" >/dev/null
for example in headless qt-form; do
  [ -d "$prefix/lib/cmake/QZIviFgen" ] || { echo "no CMake package installed"; exit 1; }
  cmake -S "$source/examples/$example" -B "$work/$example" -G Ninja \
        -DCMAKE_PREFIX_PATH="$prefix" >"$work/$example.log" 2>&1 ||
    { cat "$work/$example.log"; exit 1; }
  cmake --build "$work/$example" >>"$work/$example.log" 2>&1 || { cat "$work/$example.log"; exit 1; }
done
export QZIVI_SESSION_MANAGER=none
"$work/headless/headless_example" "$work/from-find-package.qzc"
export PKG_CONFIG_PATH=$prefix/lib/pkgconfig
# shellcheck disable=SC2046
c++ "$source/examples/headless/main.cpp" $(pkg-config --cflags --libs qzivifgen) -o "$work/from-pkg-config"
"$work/from-pkg-config" "$work/from-pkg-config.qzc"
# Both wrote the same configuration.
cmp "$work/from-find-package.qzc" "$work/from-pkg-config.qzc"
# The installed command line reads what the example wrote.
"$prefix/bin/qzfgen" configure "$work/from-pkg-config.qzc"
# The Python module, where it was built, imports from the install.
module_dir=$prefix/lib/python3/dist-packages
if ls "$module_dir"/qzivifgen*.so >/dev/null 2>&1; then
  PYTHONPATH=$module_dir /usr/bin/python3 -c \
    "import qzivifgen as q; f = q.QZIviFgen(); f.Channels.Add('Channel1'); f.Init(); f.Configure(); print('python:', f.Channels[0].Name)"
  [ -f "$module_dir/qzivifgen.pyi" ]
fi
