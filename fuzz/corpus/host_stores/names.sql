UPDATE file_system SET name='../x', container_id='y'; UPDATE volume SET directory_name='a/b', uuid='u';
