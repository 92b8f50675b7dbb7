SUMMARY = "CIM providers for the DHCP clients of a machine"
DESCRIPTION = "Shows which network interfaces take their address by DHCP, in which \
state their client is, which servers they talk to, and under which configuration name: \
as CIM classes of the DMTF's DHCP Client Profile."
SECTION = "net"
# No licence has been granted yet: ask the developers before you use, copy or change it.
LICENSE = "CLOSED"

# There is no host where the sources are fetched from: conf/local.conf says where they are, as
#   DHCP_CLIENT_PROVIDER_URI = "file:///srv/dhcp-client-provider-0.1.0.tar.gz"
#   DHCP_CLIENT_PROVIDER_URI = "git:///srv/dhcp-client-provider;protocol=file;branch=main;destsuffix=${BP}"
# the second with SRCREV:pn-dhcp-client-provider, or names a checkout with EXTERNALSRC.
DHCP_CLIENT_PROVIDER_URI ?= ""
SRC_URI = "${DHCP_CLIENT_PROVIDER_URI}"

python () {
    if not d.getVar("DHCP_CLIENT_PROVIDER_URI") and not d.getVar("EXTERNALSRC"):
        raise bb.parse.SkipRecipe("set DHCP_CLIENT_PROVIDER_URI to where its sources are")
}

DEPENDS = "cli11 curl expat gnutls libmicrohttpd libmnl nlohmann-json systemd \
virtual/crypt zlib"

inherit cmake features_check pkgconfig systemd

# For the header of its bus. Its library is loaded where there is one.
REQUIRED_DISTRO_FEATURES = "systemd"

# What a machine is read from: what an image never has can be left out of the build, such as by
#   PACKAGECONFIG:remove:pn-dhcp-client-provider = "wicked connman"
READ_SOURCES = "systemd-networkd NetworkManager wicked connman dhclient dhcpcd udhcpc dhcp6c \
ipconfig kernel-ip netplan ifupdown ifcfg bus service-processor json-tree"
PACKAGECONFIG ??= "small ${READ_SOURCES}"
PACKAGECONFIG[small] = "-DZR_SMALL=ON,-DZR_SMALL=OFF"
PACKAGECONFIG[systemd-networkd] = ",,"
PACKAGECONFIG[NetworkManager] = ",,"
PACKAGECONFIG[wicked] = ",,"
PACKAGECONFIG[connman] = ",,"
PACKAGECONFIG[dhclient] = ",,"
PACKAGECONFIG[dhcpcd] = ",,"
PACKAGECONFIG[udhcpc] = ",,"
PACKAGECONFIG[dhcp6c] = ",,"
PACKAGECONFIG[ipconfig] = ",,"
PACKAGECONFIG[kernel-ip] = ",,"
PACKAGECONFIG[netplan] = ",,"
PACKAGECONFIG[ifupdown] = ",,"
PACKAGECONFIG[ifcfg] = ",,"
PACKAGECONFIG[bus] = ",,"
PACKAGECONFIG[service-processor] = ",,"
PACKAGECONFIG[json-tree] = ",,"

EXTRA_OECMAKE = "-DCMAKE_BUILD_TYPE=Release -DBUILD_TESTING=OFF -DZR_COMPILED_TOGETHER=ON \
'-DZR_WITHOUT=${@';'.join(source for source in d.getVar('READ_SOURCES').split() \
if source not in d.getVar('PACKAGECONFIG').split())}'"

do_install:append() {
    # What Debian's packages have.
    rm -rf ${D}${datadir}/lintian ${D}${docdir}/*/changelog*
    if [ ${systemd_system_unitdir} != ${prefix}/lib/systemd/system ]; then
        install -d ${D}${systemd_system_unitdir}
        mv ${D}${prefix}/lib/systemd/system/* ${D}${systemd_system_unitdir}
        rmdir -p --ignore-fail-on-non-empty ${D}${prefix}/lib/systemd/system
    fi
}

# As those of other distributions: see docs/deployment.md. Manual pages are in ${PN}-doc, and what
# other providers are built with in ${PN}-dev and ${PN}-staticdev.
PACKAGE_BEFORE_PN = "cmpi-dhcp-client cmpi-dhcp-client-registration cmpi-dhcp-client-provider \
cmpi-dhcp-client-neighbours ${PN}-schema cimdhcp"
DEV_PKG_DEPENDENCY = ""

FILES:cmpi-dhcp-client = "${libdir}/cmpi/libDHCPClient.so \
${datadir}/dhcp-client-provider/schema/DHCPClient.registration"
RDEPENDS:cmpi-dhcp-client = "${PN}-schema (= ${EXTENDPKGV})"
# Loaded where managers are asked on the bus, and not seen by bitbake.
RRECOMMENDS:cmpi-dhcp-client = "${@bb.utils.contains('PACKAGECONFIG', 'bus', 'libsystemd', '', d)}"

FILES:cmpi-dhcp-client-provider = "${libdir}/cmpi/libDHCPClientProvider.so \
${datadir}/dhcp-client-provider/schema/exact/DHCPClientProvider.registration"
RDEPENDS:cmpi-dhcp-client-provider = "${PN}-schema (= ${EXTENDPKGV})"
RRECOMMENDS:cmpi-dhcp-client-provider = "cmpi-dhcp-client-neighbours"

FILES:cmpi-dhcp-client-neighbours = "${libdir}/cmpi/libDHCPClientNeighbours.so \
${datadir}/dhcp-client-provider/schema/exact/DHCPClientNeighbours.registration"
RDEPENDS:cmpi-dhcp-client-neighbours = "${PN}-schema (= ${EXTENDPKGV})"

FILES:${PN}-schema = "${datadir}/dhcp-client-provider ${sysconfdir}/zr \
${localstatedir}/lib/dhcp-client-provider"
CONFFILES:${PN}-schema = "${sysconfdir}/zr/platform.conf"

FILES:cimdhcp = "${bindir}/cimdhcp ${datadir}/cimdhcp ${datadir}/bash-completion ${datadir}/fish \
${datadir}/zsh"
RDEPENDS:cimdhcp = "cmpi-dhcp-client (= ${EXTENDPKGV})"
SYSTEMD_PACKAGES = "cimdhcp"
SYSTEMD_SERVICE:cimdhcp = "cimdhcp.service cimdhcp-exporter.service cimdhcp-metrics.service \
cimdhcp-metrics.timer"
SYSTEMD_AUTO_ENABLE = "disable"

# Registers the library with the object managers of the image when that first runs, as their own
# repositories are made then, too. A package of its own, since an image whose root is read-only can
# have none that does something then.
ALLOW_EMPTY:cmpi-dhcp-client-registration = "1"
RDEPENDS:cmpi-dhcp-client-registration = "cmpi-dhcp-client (= ${EXTENDPKGV})"
pkg_postinst_ontarget:cmpi-dhcp-client-registration() {
    ${datadir}/dhcp-client-provider/provider-register.sh -t installed \
        -r ${datadir}/dhcp-client-provider/schema/DHCPClient.registration || :
}
pkg_prerm:cmpi-dhcp-client-registration() {
    if [ -z "$D" ] && [ "$1" != upgrade ]; then
        ${datadir}/dhcp-client-provider/provider-register.sh -d -t installed \
            -r ${datadir}/dhcp-client-provider/schema/DHCPClient.registration || :
    fi
}
