# Sourced by run and check: installs the Debian packages of the groups named, those that are missing.

packages_of_group() {
    sed -n "/^\[$1\]/,/^\[/p" cmake/debian-packages.txt | grep -v -e '^\[' -e '^#' -e '^ *$'
}

install_packages() {
    missing=""
    for group in "$@"; do
        for package in $(packages_of_group "$group"); do
            dpkg-query -W -f '${db:Status-Status}' "$package" 2>/dev/null | grep -qx installed ||
                missing="$missing $package"
        done
    done
    [ -n "$missing" ] || return 0

    echo "Installing$missing" >&2
    as_root=""
    if [ "$(id -u)" != 0 ]; then
        command -v sudo >/dev/null || {
            echo "These Debian packages are missing, and there is no sudo to install them with:$missing" >&2
            return 1
        }
        as_root="sudo"
    fi
    # The package names are words of a list: they are split on purpose.
    $as_root env DEBIAN_FRONTEND=noninteractive apt-get install -qq -y --no-install-recommends \
        $missing >/dev/null 2>&1 && return 0
    $as_root apt-get update -qq
    $as_root env DEBIAN_FRONTEND=noninteractive apt-get install -qq -y --no-install-recommends \
        $missing >/dev/null
}
