# Completion of zubtool(1) for fish.

# Prints the words typed so far of the command, which "--" ends.
function __zubtool_group
    set -l group
    for word in (commandline -opc)[2..]
        if test "$word" = --
            set group
        else
            set -a group $word
        end
    end
    string join \n -- $group
end

function __zubtool_at_path
    set -l group (__zubtool_group)
    test "$group[1..2]" = 'logdump oslog' -a (count $group) -eq 3
end

function __zubtool_offer
    set -l group (__zubtool_group)

    set -l compression \
        nocompress\t'leave the logs as they are' \
        tar.gz\t'pack them into a compressed archive' \
        tar\t'pack them into an archive'
    set -l no_ui nonui\t'ask nobody for confirmation'
    set -l next --\t'end of the command, another follows'
    set -l offered
    switch "$group[1..2]"
        case ''
            set offered \
                logdump\t'collect logs' \
                cd\t'go to a sub-command' \
                help\t'list commands' \
                back\t'go to the command above' \
                quit\t'end with success' \
                exit\t'end with success'
        case cd
            set offered logdump\t'collect logs'
        case logdump
            set offered \
                bb\t'collect baseband logs only' \
                core\t'collect telephony logs with coredump; resets the baseband' \
                oslog\t'collect oslog to txt' \
                tel\t'collect telephony logs' \
                help\t'list commands'
        case 'logdump tel' 'logdump core'
            set offered $compression $no_ui $next
        case 'logdump bb'
            set offered $compression $next
        case 'logdump oslog'
            switch (count $group)
                case 2
                    set offered 600\t'ten minutes' 3600\t'an hour' 86400\t'a day'
                case 3 # a path, which fish itself completes
                    return
                case '*'
                    contains -- $group[-1] -p -i # a name, which only the user knows
                    and return
                    set offered -p\t'names of processes' -i\t'texts in paths of images' $next
            end
    end
    if contains -- "$group[2]" tel core bb
        for word in $group[3..] # options end at the reason
            contains -- (string lower -- $word) nocompress tar.gz tar nonui
            or set offered
        end
    end
    printf '%s\n' $offered
end

complete -c zubtool -n 'not __zubtool_at_path' -f
complete -c zubtool -n __zubtool_at_path -F
complete -c zubtool -k -a '(__zubtool_offer)'
