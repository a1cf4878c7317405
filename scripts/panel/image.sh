# SPDX-License-Identifier: Apache-2.0
# Kernel and file system of the emulated panel. Sourced by scripts/panel/test.sh.

panel_image=$project_dir/build/panel-image
panel_root=$panel_image/root

# The newest kernel that Debian's own kernel package for the processor asks for.
kernel_package() {
  packages_for armhf linux-image-armmp >&2
  dpkg-deb -f "$project_dir/build/panel-packages/armhf/linux-image-armmp"_*.deb Depends |
    grep -o 'linux-image-[^ ,]*armmp' | head -1
}

# install_kernel: vmlinuz, and the modules of the disk (the UART's driver is built in).
install_kernel() {
  local package release module file modules=(kernel/drivers/virtio/virtio_pci.ko
    kernel/drivers/block/virtio_blk.ko kernel/crypto/crc32c_generic.ko kernel/fs/ext4/ext4.ko)
  package=$(kernel_package)
  release=${package#linux-image-}
  if [ ! -f "$panel_image/kernel/boot/vmlinuz-$release" ]; then
    packages_for armhf "$package"
    say "Unpacking the kernel $release"
    unpack_packages armhf "$panel_image/kernel" "$package"
    /sbin/depmod -b "$panel_image/kernel" "$release"
  fi
  cp "$panel_image/kernel/boot/vmlinuz-$release" "$panel_image/vmlinuz"
  mkdir -p "$panel_root/modules"
  : >"$panel_root/modules/order"
  for module in "${modules[@]}"; do
    # A module's line names what it needs, the innermost last.
    for file in $(sed -n "s|^$module:||p" "$panel_image/kernel/lib/modules/$release/modules.dep" |
      tr ' ' '\n' | tac) "$module"; do
      cp "$panel_image/kernel/lib/modules/$release/$file" "$panel_root/modules/"
      echo "${file##*/}" >>"$panel_root/modules/order"
    done
  done
}

# install_program ABI FILE: with the shared libraries that it needs. The kernel runs programs of both
# ABIs; those for armel and their libraries have a folder of their own.
install_program() {
  local abi=$1 prefix=$panel_root
  [ "$abi" = armhf ] || prefix=$panel_root/$abi
  mkdir -p "$prefix/opt" "$prefix/lib" "$panel_root/lib"
  "$(panel_triplet "$abi")-strip" -o "$prefix/opt/${2##*/}" "$2"
  install_libraries_of "$abi" "$prefix/lib" "$2"
}

# install_libraries_of ABI FOLDER FILE. A program names its loader with the path, so that is /lib.
install_libraries_of() {
  local abi=$1 destination=$2 triplet library folder
  triplet=$(panel_triplet "$abi")
  for library in $("$triplet-readelf" -d "$3" | sed -n 's/.*(NEEDED).*\[\(.*\)\].*/\1/p') \
    $("$triplet-readelf" -l "$3" | sed -n 's|.*interpreter: /lib/\(.*\)].*|\1|p'); do
    [ ! -e "$destination/$library" ] || continue
    for folder in "/usr/$triplet/lib" "$(panel_build_dir "$abi")/target/usr/lib/$triplet" \
      "$(panel_build_dir "$abi")/target/lib/$triplet"; do
      [ -e "$folder/$library" ] || continue
      cp -L "$folder/$library" "$destination/$library"
      install_libraries_of "$abi" "$destination" "$folder/$library"
      break
    done
    [ -e "$destination/$library" ] || die "no $library for the panel"
    case $library in ld-linux*) [ -e "$panel_root/lib/$library" ] ||
      cp "$destination/$library" "$panel_root/lib/" ;; esac
  done
}

# make_image: everything, packed. The libraries are those of the archives.
make_image() {
  local abi program
  say "Making the panel's image"
  rm -rf "$panel_root"
  mkdir -p "$panel_root"/{bin,dev,proc,sys,tmp,run,data}
  packages_for armhf busybox-static
  unpack_packages armhf "$panel_image/busybox" busybox-static
  cp "$panel_image/busybox/bin/busybox" "$panel_root/bin/"
  ln -s busybox "$panel_root/bin/sh"
  cp "$project_dir/scripts/panel/init" "$panel_root/init"
  install_kernel
  for abi in "${panel_abis[@]}"; do
    for program in libLOKA.so minimal_host; do
      install_program "$abi" "$panel_image/archive/$abi/$program"
    done
  done
  for program in loka plugin_tests arm_difference_tests line_settings; do
    install_program armhf "$(panel_build_dir armhf)/$program"
  done
  # A plug-in test compares the library's description with its source.
  mkdir -p "$panel_root$project_dir/driver"
  cp "$project_dir/driver/Xml_LOKA.xml" "$panel_root$project_dir/driver/"
  (cd "$panel_root" && find . | cpio -o -H newc --quiet | gzip -1) >"$panel_image/initramfs.gz"
}
