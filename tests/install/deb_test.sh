#!/bin/bash
# deb_test.sh BUILD_DIR GUI(0|1)
# Makes the Debian package from the build, has lintian check it, and compares its files with
# what "cmake --install" puts under /usr. Skipped (exit 77) when a tool is missing.
set -u
build=$1
gui=$2
fail() { echo "FAIL: $*" >&2; exit 1; }

for tool in cpack dpkg-deb dpkg-shlibdeps lintian; do
  command -v $tool >/dev/null || { echo "$tool is not installed: skipped"; exit 77; }
done

stage=$(mktemp -d)
trap 'rm -rf "$stage"' EXIT
# Packaged into the scratch folder, so the build folder gains nothing.
cpack -G DEB --config "$build/CPackConfig.cmake" -B "$stage/package" >"$stage/cpack.log" 2>&1 ||
  { cat "$stage/cpack.log"; fail "cpack"; }
debs=("$stage"/package/quillane_*_"$(dpkg --print-architecture)".deb)
[ ${#debs[@]} = 1 ] && [ -s "${debs[0]}" ] || { ls "$stage/package"; fail "no single quillane_<version>_<arch>.deb"; }
deb=${debs[0]}

lintian --fail-on error --tag-display-limit 0 "$deb" || fail "lintian reports errors"

dpkg-deb -f "$deb" Package | grep -qx quillane || fail "package name"
depends=$(dpkg-deb -f "$deb" Depends)
for library in libjpeg62-turbo libpng16 libexif12 libqt6core6; do
  [[ $depends == *"$library"* ]] || fail "Depends lacks $library: $depends"
done

# The same files as "cmake --install" gives under /usr, but for the manual page, which is
# compressed, the copyright file and changelog every Debian package carries, and lintian's notes.
DESTDIR=$stage/root cmake --install "$build" --prefix /usr >"$stage/install.log" 2>&1 ||
  { cat "$stage/install.log"; fail "cmake --install"; }
(cd "$stage/root" && find . -type f | sed 's|^\./|/|; s|\(/man/man[0-9]/.*\.[0-9]\)$|\1.gz|' | sort) \
  >"$stage/installed"
printf '%s\n' /usr/share/doc/quillane/copyright /usr/share/doc/quillane/changelog.gz \
  /usr/share/lintian/overrides/quillane >>"$stage/installed"
sort -o "$stage/installed" "$stage/installed"
dpkg -c "$deb" | awk '$1 !~ /^d/ {print $6}' | sed 's|^\./|/|' | sort >"$stage/packaged"
diff "$stage/installed" "$stage/packaged" || fail "the package's files differ from the install's"
if [ "$gui" = 1 ]; then
  grep -qx /usr/bin/quillane "$stage/packaged" || fail "no /usr/bin/quillane"
  grep -qx /usr/share/applications/io.github.quillane.Quillane.desktop "$stage/packaged" ||
    fail "no desktop entry"
fi
# Installed files belong to root; the packaged desktop entry is the installed one, byte for byte.
dpkg -c "$deb" | awk '$2 != "root/root" {print; bad=1} END {exit bad}' || fail "files not owned by root"
mkdir "$stage/unpacked" && dpkg-deb -x "$deb" "$stage/unpacked" || fail "dpkg-deb -x"
for f in share/applications/io.github.quillane.Quillane.desktop \
         share/metainfo/io.github.quillane.Quillane.metainfo.xml; do
  [ "$gui" = 1 ] || continue
  cmp "$stage/root/usr/$f" "$stage/unpacked/usr/$f" || fail "$f differs from the installed one"
done
echo "packaged and checked: $(basename "$deb")"
